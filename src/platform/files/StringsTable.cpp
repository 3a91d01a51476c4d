#include "platform/files/StringsTable.h"

#include "base/Text.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <optional>
#include <utility>

namespace platform {

namespace {

constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";
constexpr std::string_view kSpaces = " \t\r\n\v\f";
constexpr int kHexadecimal = 16;

bool isBare(char character)
{
    return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z')
           || (character >= '0' && character <= '9') || character == '_' || character == '.' || character == '-';
}

std::string utf8Of(std::uint32_t character)
{
    const auto byte = [](std::uint32_t bits) { return static_cast<char>(bits); };
    if (character < 0x80)
        return {byte(character)};
    if (character < 0x800)
        return {byte(0xC0 | (character >> 6U)), byte(0x80 | (character & 0x3FU))};
    return {byte(0xE0 | (character >> 12U)), byte(0x80 | ((character >> 6U) & 0x3FU)),
            byte(0x80 | (character & 0x3FU))};
}

class Parser {
public:
    explicit Parser(std::string_view text) : m_text(text)
    {
        if (m_text.starts_with(kByteOrderMark))
            m_at = kByteOrderMark.size();
    }

    /// Why it stops; null at the end.
    const char* parse(StringsTable& table)
    {
        while (skipBetween()) {
            auto key = word();
            if (!key)
                return m_trouble;
            if (!take('='))
                return m_trouble ? m_trouble : "there is no = behind the key";
            auto text = word();
            if (!text)
                return m_trouble;
            if (!take(';'))
                return m_trouble ? m_trouble : "there is no ; behind the text";
            table.insert_or_assign(std::move(*key), std::move(*text));
        }
        return m_trouble;
    }

    std::size_t line() const
    {
        const auto end = m_text.begin() + static_cast<std::ptrdiff_t>(std::min(m_at, m_text.size()));
        return 1 + static_cast<std::size_t>(std::count(m_text.begin(), end, '\n'));
    }

private:
    /// To the next word or sign; false at the end, and in a comment that has none.
    bool skipBetween()
    {
        for (;;) {
            m_at = std::min(m_text.find_first_not_of(kSpaces, m_at), m_text.size());
            const std::string_view rest = m_text.substr(m_at);
            if (rest.starts_with("//")) {
                m_at = std::min(m_text.find('\n', m_at), m_text.size());
            } else if (rest.starts_with("/*")) {
                const std::size_t end = m_text.find("*/", m_at + 2);
                if (end == std::string_view::npos) {
                    m_trouble = "this comment has no end";
                    return false;
                }
                m_at = end + 2;
            } else {
                return !rest.empty();
            }
        }
    }

    bool take(char sign)
    {
        if (!skipBetween() || m_text[m_at] != sign)
            return false;
        ++m_at;
        return true;
    }

    std::optional<std::string> word()
    {
        if (!skipBetween())
            return refused(m_trouble ? m_trouble : "it ends too early");
        if (m_text[m_at] == '"')
            return quoted();
        const std::size_t begin = m_at;
        while (m_at < m_text.size() && isBare(m_text[m_at]))
            ++m_at;
        if (m_at == begin)
            return refused("there is no word here");
        return std::string(m_text.substr(begin, m_at - begin));
    }

    std::optional<std::string> quoted()
    {
        const std::size_t begin = m_at++;
        std::string result;
        for (; m_at < m_text.size(); ++m_at) {
            if (m_text[m_at] == '"') {
                ++m_at;
                return result;
            }
            if (m_text[m_at] != '\\') {
                result += m_text[m_at];
                continue;
            }
            const auto meant = escaped();
            if (!meant)
                return std::nullopt;
            result += *meant;
        }
        m_at = begin;
        return refused("these quotes have no end");
    }

    /// Stands at the backslash before, at the last character of the escape after.
    std::optional<std::string> escaped()
    {
        ++m_at;
        switch (m_at < m_text.size() ? m_text[m_at] : '\0') {
        case '"':
        case '\\':
            return std::string(1, m_text[m_at]);
        case 'n':
            return "\n";
        case 'r':
            return "\r";
        case 't':
            return "\t";
        case 'U':
            return numbered();
        default:
            return refused("nothing is written with this backslash");
        }
    }

    std::optional<std::string> numbered()
    {
        constexpr std::size_t kDigits = 4;
        std::uint32_t character = 0;
        for (std::size_t i = 1; i <= kDigits; ++i) {
            const int digit = m_at + i < m_text.size() ? base::hexadecimalDigit(m_text[m_at + i]) : -1;
            if (digit < 0)
                return refused("a character has four hexadecimal digits");
            character = character * kHexadecimal + static_cast<std::uint32_t>(digit);
        }
        if (character >= 0xD800 && character < 0xE000)
            return refused("half a character stands for nothing; write it as it is");
        m_at += kDigits;
        return utf8Of(character);
    }

    std::nullopt_t refused(const char* why)
    {
        m_trouble = why;
        return std::nullopt;
    }

    std::string_view m_text;
    std::size_t m_at = 0;
    const char* m_trouble = nullptr;
};

/// Where what is not UTF-8 begins; the size of all when it is.
std::size_t firstForeignByte(std::string_view text)
{
    std::size_t at = 0;
    while (at < text.size()) {
        const std::size_t length = base::characterLength(text.substr(at));
        if (length == 0)
            break;
        at += length;
    }
    return at;
}

} // namespace

ParsedStrings parseStrings(std::string_view text, const std::string& name)
{
    const std::size_t foreign = firstForeignByte(text);
    Parser parser(text.substr(0, foreign));
    ParsedStrings parsed;
    if (const char* why = parser.parse(parsed.table))
        parsed.error = base::Error::make(base::kPosixErrorDomain, EINVAL,
                                         name + ", line " + std::to_string(parser.line()) + ": " + why);
    if (foreign < text.size())
        parsed.error = base::Error::make(base::kPosixErrorDomain, EILSEQ,
                                         name + ", line " + std::to_string(parser.line()) + ": this is not UTF-8");
    return parsed;
}

} // namespace platform

#include "base/Url.h"

#include "base/Text.h"

#include <utility>

namespace base {

namespace {

// Not std::isalnum, which asks the locale.
bool isLetter(char character)
{
    return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z');
}

bool isLetterOrDigit(char character)
{
    return isLetter(character) || (character >= '0' && character <= '9');
}

std::string encoded(std::string_view path)
{
    static constexpr char kHex[] = "0123456789ABCDEF";
    std::string text;
    for (const char character : path) {
        const auto byte = static_cast<unsigned char>(character);
        if (isLetterOrDigit(character)
            || std::string_view("/-._~!$&'()*+,;=:@").find(character) != std::string_view::npos) {
            text += character;
        } else {
            text += '%';
            text += kHex[byte >> 4];
            text += kHex[byte & 15];
        }
    }
    return text;
}

std::string decoded(std::string_view text)
{
    std::string path;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const bool escape = text[i] == '%' && i + 2 < text.size() && hexadecimalDigit(text[i + 1]) >= 0
                            && hexadecimalDigit(text[i + 2]) >= 0;
        path +=
            escape ? static_cast<char>(hexadecimalDigit(text[i + 1]) * 16 + hexadecimalDigit(text[i + 2])) : text[i];
        i += escape ? 2 : 0;
    }
    return path;
}

} // namespace

Url Url::fromPath(std::string path)
{
    Url url;
    url.m_scheme = "file";
    url.m_path = std::move(path);
    return url;
}

std::optional<Url> Url::fromString(std::string_view text)
{
    const auto colon = text.find(':');
    if (colon == std::string_view::npos || colon == 0 || !isLetter(text.front()))
        return std::nullopt;
    std::string scheme;
    for (const char character : text.substr(0, colon)) {
        if (!isLetterOrDigit(character) && character != '+' && character != '-' && character != '.')
            return std::nullopt;
        scheme += lowercase(character);
    }
    const std::string_view rest = text.substr(colon + 1);
    if (scheme == "file") {
        if (!rest.starts_with("//"))
            return fromPath(decoded(rest));
        const auto slash = rest.find('/', 2);
        return fromPath(slash == std::string_view::npos ? "/" : decoded(rest.substr(slash)));
    }
    Url url;
    url.m_scheme = std::move(scheme);
    url.m_rest = std::string(rest);
    return url;
}

std::string Url::lastPathComponent() const
{
    const auto slash = m_path.rfind('/');
    return slash == std::string::npos ? m_path : m_path.substr(slash + 1);
}

std::string Url::string() const
{
    if (!isFile())
        return m_scheme + ":" + m_rest;
    // Behind two slashes the first part of a relative path would read as the name of a host.
    return (m_path.starts_with('/') ? "file://" : "file:") + encoded(m_path);
}

} // namespace base

#include "platform/sharing/QuietText.h"

#include "base/Text.h"

#include <algorithm>

namespace platform {

namespace {

constexpr const char* kEllipsis = "…";
constexpr const char* kFirstStrongIsolate = "\u2068";
constexpr const char* kPopDirectionalIsolate = "\u2069";
constexpr std::size_t kNameCharacters = 120;
/// What is left out counts too, this many times over: a text of nothing but marks ends as well.
constexpr std::size_t kPatience = 8;

/// Marks, embeddings, overrides and isolates of direction, and what has neither width nor meaning here.
bool turnsText(std::string_view character)
{
    return character == "\u061C" || character == "\u200E" || character == "\u200F" || character == "\uFEFF"
           || character == "\u200B" || (character >= "\u202A" && character <= "\u202E")
           || (character >= "\u2066" && character <= "\u2069");
}

bool breaksLine(std::string_view character)
{
    return character == "\n" || character == "\r" || character == "\u2028" || character == "\u2029" || character == "\v"
           || character == "\f" || character == "\u0085";
}

bool isControl(std::string_view character)
{
    const auto first = static_cast<unsigned char>(character.front());
    if (character.size() == 1)
        return first < 0x20 || first == 0x7F;
    return first == 0xC2 && static_cast<unsigned char>(character[1]) < 0xA0; // U+0080 to U+009F
}

void append(std::string& text, std::string_view character, char separator)
{
    const bool isSpace = character == " " || character == "\n";
    if (!isSpace) {
        text += character;
        return;
    }
    // Of several in a row the strongest stays; none stands at the beginning.
    if (text.empty() || text.back() == '\n')
        return;
    if (text.back() == ' ')
        text.pop_back();
    text += character == "\n" ? separator : ' ';
}

std::string quiet(std::string_view text, std::size_t mostCharacters, char separator)
{
    std::string result;
    std::size_t shown = 0;
    std::size_t read = 0;
    while (!text.empty() && shown < mostCharacters && read < mostCharacters * kPatience) {
        ++read;
        const std::size_t length = base::characterLength(text);
        const std::string_view character = text.substr(0, std::max<std::size_t>(1, length));
        text.remove_prefix(character.size());
        if (length == 0 || turnsText(character))
            continue;
        const std::size_t before = result.size();
        if (breaksLine(character))
            append(result, "\n", separator);
        else
            append(result, isControl(character) ? " " : character, separator);
        shown += result.size() != before ? 1 : 0;
    }
    while (!result.empty() && (result.back() == ' ' || result.back() == '\n'))
        result.pop_back();
    if (!text.empty())
        result += kEllipsis;
    return result;
}

} // namespace

std::string quietText(std::string_view text, std::size_t mostCharacters)
{
    return quiet(text, mostCharacters, '\n');
}

std::string quietName(std::string_view name)
{
    return kFirstStrongIsolate + quiet(name, kNameCharacters, ' ') + kPopDirectionalIsolate;
}

} // namespace platform

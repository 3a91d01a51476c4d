#include "base/Text.h"

#include <algorithm>

namespace base {

namespace {

/// Whether a terminal would obey a character instead of showing it.
bool isControl(std::string_view character)
{
    const auto byte = [character](std::size_t i) { return static_cast<unsigned char>(character[i]); };
    if (character.size() == 1)
        return byte(0) < 0x20 || byte(0) == 0x7F;
    if (character.size() == 2)
        return byte(0) == 0xC2 && byte(1) < 0xA0; // U+0080 to U+009F
    // The ends of lines and paragraphs, and what embeds, overrides or isolates a direction.
    return character == "\u2028" || character == "\u2029" || (character >= "\u202A" && character <= "\u202E")
           || (character >= "\u2066" && character <= "\u2069");
}

} // namespace

char lowercase(char character)
{
    return character >= 'A' && character <= 'Z' ? static_cast<char>(character - 'A' + 'a') : character;
}

int hexadecimalDigit(char character)
{
    if (character >= '0' && character <= '9')
        return character - '0';
    if (character >= 'a' && character <= 'f')
        return character - 'a' + 10;
    if (character >= 'A' && character <= 'F')
        return character - 'A' + 10;
    return -1;
}

std::size_t characterLength(std::string_view text)
{
    const auto byte = [text](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    if (text.empty())
        return 0;
    const std::size_t length = byte(0) < 0x80                      ? 1
                               : byte(0) >= 0xC2 && byte(0) < 0xE0 ? 2
                               : byte(0) >= 0xE0 && byte(0) < 0xF0 ? 3
                               : byte(0) >= 0xF0 && byte(0) < 0xF5 ? 4
                                                                   : 0;
    if (length > text.size())
        return 0;
    for (std::size_t i = 1; i < length; ++i)
        if ((byte(i) & 0xC0) != 0x80)
            return 0;
    // Neither longer than needed, nor half a surrogate pair, nor beyond the last character.
    if ((byte(0) == 0xE0 && byte(1) < 0xA0) || (byte(0) == 0xED && byte(1) > 0x9F)
        || (byte(0) == 0xF0 && byte(1) < 0x90) || (byte(0) == 0xF4 && byte(1) > 0x8F))
        return 0;
    return length;
}

std::string formatted(std::string_view format, const std::vector<std::string>& arguments)
{
    std::string text;
    std::size_t next = 0;
    while (!format.empty()) {
        const std::size_t percent = std::min(format.find('%'), format.size());
        text += format.substr(0, percent);
        format.remove_prefix(percent);
        if (format.starts_with("%%")) {
            text += '%';
            format.remove_prefix(2);
        } else if (format.starts_with("%@")) {
            if (next < arguments.size())
                text += arguments[next];
            ++next;
            format.remove_prefix(2);
        } else if (format.size() >= 4 && format[1] >= '1' && format[1] <= '9' && format.substr(2, 2) == "$@") {
            const auto place = static_cast<std::size_t>(format[1] - '1');
            if (place < arguments.size())
                text += arguments[place];
            format.remove_prefix(4);
        } else if (!format.empty()) {
            text += '%';
            format.remove_prefix(1);
        }
    }
    return text;
}

std::string printable(std::string_view text)
{
    std::string line;
    line.reserve(text.size());
    while (!text.empty()) {
        const std::size_t length = characterLength(text);
        const std::string_view character = text.substr(0, length == 0 ? 1 : length);
        line += length == 0 || isControl(character) ? std::string_view("?") : character;
        text.remove_prefix(character.size());
    }
    return line;
}

} // namespace base

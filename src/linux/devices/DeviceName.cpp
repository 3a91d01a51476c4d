#include "linux/devices/DeviceName.h"

#include "base/Text.h"

namespace devices {

namespace {

bool isBetween(std::string_view character, std::string_view first, std::string_view last)
{
    return character.size() == first.size() && character >= first && character <= last;
}

bool isSpace(std::string_view character)
{
    return character == " " || isBetween(character, "\t", "\r") || character == "\u00A0" || character == "\u1680"
           || isBetween(character, "\u2000", "\u200A") || character == "\u2028" || character == "\u2029"
           || character == "\u202F" || character == "\u205F" || character == "\u3000";
}

/// What is not seen itself, but what it does to its neighbours. The joiners U+200C and U+200D belong to writing.
bool isHidden(std::string_view character)
{
    if (character.size() == 1)
        return static_cast<unsigned char>(character[0]) < 0x20 || character[0] == 0x7F;
    return isBetween(character, "\u0080", "\u009F") || character == "\u00AD" || character == "\u061C"
           || character == "\u180E" || character == "\u200B" || character == "\u200E" || character == "\u200F"
           || isBetween(character, "\u202A", "\u202E") || isBetween(character, "\u2060", "\u206F")
           || character == "\uFEFF" || isBetween(character, "\uFFF9", "\uFFFB")
           || isBetween(character, "\U000E0000", "\U000E007F");
}

} // namespace

std::string readableName(std::string_view name)
{
    std::string line;
    std::size_t count = 0;
    bool spaced = false;
    bool seen = false;
    while (!name.empty()) {
        const std::size_t length = base::characterLength(name);
        const std::string_view character = name.substr(0, length == 0 ? 1 : length);
        name.remove_prefix(character.size());
        if (length == 0)
            continue;
        if (isSpace(character)) {
            spaced = !line.empty();
            continue;
        }
        if (isHidden(character))
            continue;
        const std::size_t more = spaced ? 2 : 1;
        if (count + more > kLongestName) {
            line += "…";
            break;
        }
        line += spaced ? " " : "";
        line += character;
        count += more;
        spaced = false;
        seen =
            seen || !(character == "\u200C" || character == "\u200D" || character == "\u2800" || character == "\u3164");
    }
    return seen ? line : std::string();
}

} // namespace devices

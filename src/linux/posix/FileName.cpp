#include "linux/posix/FileName.h"

#include <algorithm>
#include <glib.h>
#include <memory>
#include <utility>

namespace posix {

namespace {

constexpr std::size_t kLongestExtension = 10;

/// What the file systems of cards and other systems refuse in a name.
constexpr std::u32string_view kRefused = U"/\\:*?\"<>|";

enum class Kind { Plain, Space, Refused, Nothing };

Kind kindOf(gunichar character)
{
    if (g_unichar_isspace(character))
        return Kind::Space;
    // The joiners belong to words and faces; other marks without a width only turn text around, or hide.
    if (character == 0x200C || character == 0x200D)
        return Kind::Plain;
    const GUnicodeType type = g_unichar_type(character);
    if (type == G_UNICODE_FORMAT || type == G_UNICODE_CONTROL)
        return Kind::Nothing;
    return kRefused.find(static_cast<char32_t>(character)) == std::u32string_view::npos ? Kind::Plain : Kind::Refused;
}

/// With its dot; empty where there is none that a program would know.
std::string_view extensionOf(std::string_view name)
{
    const std::size_t dot = name.rfind('.');
    if (dot == std::string_view::npos || dot == 0)
        return {};
    const std::string_view letters = name.substr(dot + 1);
    const bool isPlain = std::all_of(letters.begin(), letters.end(), [](char c) { return g_ascii_isalnum(c); });
    return letters.empty() || letters.size() > kLongestExtension || !isPlain ? std::string_view() : name.substr(dot);
}

} // namespace

std::string fileNameSafe(std::string_view text, std::size_t mostBytes)
{
    const std::unique_ptr<char, decltype(&g_free)> valid(
        g_utf8_make_valid(text.data(), static_cast<gssize>(text.size())), &g_free);
    std::string safe;
    bool needsSpace = false;
    for (const char* at = valid.get(); *at != 0; at = g_utf8_next_char(at)) {
        std::string_view character(at, static_cast<std::size_t>(g_utf8_next_char(at) - at));
        const Kind kind = kindOf(g_utf8_get_char(at));
        if (kind == Kind::Refused)
            character = "-";
        // A dot in front hides a file, a dash in front makes it look like an option.
        if (kind == Kind::Nothing || (safe.empty() && (character == "." || character == "-")))
            continue;
        if (kind == Kind::Space) {
            needsSpace = !safe.empty();
            continue;
        }
        if (safe.size() + (needsSpace ? 1 : 0) + character.size() > mostBytes)
            break;
        if (std::exchange(needsSpace, false))
            safe += ' ';
        safe += character;
    }
    return safe.empty() ? "Recording" : safe;
}

std::string wholeFileNameSafe(std::string_view name, std::size_t mostBytes)
{
    const std::string_view extension = extensionOf(name);
    return fileNameSafe(name.substr(0, name.size() - extension.size()), mostBytes - extension.size())
           + std::string(extension);
}

} // namespace posix

#include "linux/portals/MailText.h"

#include <glib.h>

#include <memory>

namespace portals {

namespace {

constexpr std::string_view kEllipsis = "…";

enum class Lines { One, Many };

bool isDropped(gunichar character, Lines lines)
{
    if (lines == Lines::Many && (character == '\n' || character == '\t'))
        return false;
    if (g_unichar_type(character) == G_UNICODE_CONTROL)
        return true;
    const bool joins = character == 0x200C || character == 0x200D; // they belong to words and faces
    return lines == Lines::One && g_unichar_type(character) == G_UNICODE_FORMAT && !joins;
}

std::string mailText(std::string_view text, std::size_t mostBytes, Lines lines)
{
    // All that can come of the rest is left out: a character has up to four bytes.
    const bool isHuge = text.size() > mostBytes * 8;
    const std::string_view begin = text.substr(0, isHuge ? mostBytes * 8 : text.size());
    const std::unique_ptr<char, decltype(&g_free)> valid(
        g_utf8_make_valid(begin.data(), static_cast<gssize>(begin.size())), &g_free);
    std::string kept;
    std::size_t end = 0; ///< where the ellipsis would stand
    for (const char* at = valid.get(); *at != 0; at = g_utf8_next_char(at)) {
        const gunichar character = g_utf8_get_char(at);
        if (lines == Lines::One && (character == '\n' || character == '\t')) {
            kept += ' ';
        } else if (!isDropped(character, lines)) {
            kept.append(at, static_cast<std::size_t>(g_utf8_next_char(at) - at));
        }
        if (kept.size() + kEllipsis.size() <= mostBytes)
            end = kept.size();
        if (kept.size() > mostBytes)
            break;
    }
    if (kept.size() > mostBytes || isHuge) {
        kept.resize(end);
        kept += kEllipsis;
    }
    return kept;
}

} // namespace

std::string mailSubject(std::string_view text)
{
    return mailText(text, kLongestMailSubject, Lines::One);
}

std::string mailBody(std::string_view text)
{
    return mailText(text, kLongestMailBody, Lines::Many);
}

} // namespace portals

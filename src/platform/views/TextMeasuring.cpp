#include "platform/views/TextMeasuring.h"

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

/// An average letter of the system font, by its size.
constexpr double kLetterWidth = 0.6;
/// Han, kana and Hangul: U+3000 to U+D7FF, and a few behind that.
constexpr double kWideLetterWidth = 1;
constexpr double kLineHeight = 1.25;

/// By the font's size.
double estimatedWidth(std::string_view line)
{
    double width = 0;
    for (const char each : line) {
        const auto byte = static_cast<unsigned char>(each);
        if ((byte & 0xC0U) != 0x80U) // the first of a letter
            width += byte >= 0xE3U && byte <= 0xEDU ? kWideLetterWidth : kLetterWidth;
    }
    return width;
}

/// Calls `visit` for each line of `text`, until it says that it has had enough.
template <typename Visit> void forEachLine(std::string_view text, const Visit& visit)
{
    while (true) {
        const std::size_t end = text.find('\n');
        if (!visit(text.substr(0, end)) || end == std::string_view::npos)
            return;
        text.remove_prefix(end + 1);
    }
}

} // namespace

double EstimatedText::widthOf(std::string_view text, const TextStyle& style) const
{
    double widest = 0;
    forEachLine(text, [&](std::string_view line) {
        widest = std::max(widest, estimatedWidth(line));
        return true;
    });
    return widest * style.fontSize;
}

double EstimatedText::heightOf(std::string_view text, const TextStyle& style, double width, int mostLines) const
{
    if (text.empty() || width <= 0)
        return 0;
    double lines = 0;
    forEachLine(text, [&](std::string_view line) {
        lines += std::max(1.0, std::ceil(estimatedWidth(line) * style.fontSize / width));
        return mostLines <= 0 || lines < mostLines;
    });
    if (mostLines > 0)
        lines = std::min<double>(lines, mostLines);
    return std::ceil(lines * style.fontSize * kLineHeight);
}

} // namespace platform

/// A colour: red, green, blue and opacity, each from 0 to 1, in sRGB, not premultiplied.
#pragma once

#include <optional>
#include <string_view>

namespace platform {

struct Color {
    double red = 0;
    double green = 0;
    double blue = 0;
    double alpha = 1;

    static constexpr Color white(double level, double alpha = 1) { return {level, level, level, alpha}; }
    static constexpr Color black() { return {0, 0, 0, 1}; }
    static constexpr Color clear() { return {0, 0, 0, 0}; }
    /// "#RRGGBB" or "#RRGGBBAA", any case; nothing for all else.
    static std::optional<Color> fromHex(std::string_view text);

    friend bool operator==(const Color&, const Color&) = default;
};

} // namespace platform

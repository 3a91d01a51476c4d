#include "platform/views/Color.h"

#include <array>
#include <charconv>
#include <cstddef>

namespace platform {

std::optional<Color> Color::fromHex(std::string_view text)
{
    if ((text.size() != 7 && text.size() != 9) || text.front() != '#')
        return std::nullopt;
    std::array<double, 4> parts{0, 0, 0, 1};
    for (std::size_t i = 0; 1 + i * 2 < text.size(); ++i) {
        unsigned value = 0;
        const char* const begin = text.data() + 1 + i * 2;
        const auto [end, error] = std::from_chars(begin, begin + 2, value, 16);
        if (error != std::errc() || end != begin + 2)
            return std::nullopt;
        parts[i] = value / 255.0;
    }
    return Color{parts[0], parts[1], parts[2], parts[3]};
}

} // namespace platform

#include "Signals.h"

#include <cstdint>

namespace tests {

Signal speechLike(double level)
{
    return [=](double seconds, int channel) {
        const double pi = std::numbers::pi;
        double sum = 0;
        for (int i = 1; i <= 5; ++i) {
            const double frequency = 180.0 * i + 37.0 * channel;
            // Each partial wanders and breathes in its own time.
            sum += std::sin(2 * pi * frequency * seconds + 9 * std::sin(2 * pi * (0.31 + 0.13 * i) * seconds) * i)
                   * (0.6 + 0.4 * std::sin(2 * pi * (1.7 + 0.6 * i) * seconds)) / i;
        }
        return level * sum / 2;
    };
}

Signal humming(double level)
{
    return [=](double seconds, int channel) {
        double sum = 0;
        for (int i = 1; i <= 5; ++i)
            sum += std::sin(2 * std::numbers::pi * (170.0 * i + 31.0 * channel) * seconds
                            + 3 * std::sin(2 * std::numbers::pi * (0.11 + 0.03 * i) * seconds) * i)
                   / i;
        // With a little of each frequency, as there is in any room; nor does it begin at once.
        auto noise = static_cast<std::uint32_t>(std::llround(seconds * 192000) * 2 + channel) * 2654435761u;
        noise = (noise ^ noise >> 15) * 2246822519u;
        sum += 0.01 * (static_cast<double>(noise ^ noise >> 13) / 2147483648.0 - 1);
        return level * std::min(1.0, seconds / 0.5) * sum / 2;
    };
}

} // namespace tests

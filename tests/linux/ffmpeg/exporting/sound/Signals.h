/// Sound as formulas, and how loud a tone is in samples.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <functional>
#include <numbers>
#include <vector>

namespace tests {

/// The sample of a channel at a moment in seconds.
using Signal = std::function<double(double seconds, int channel)>;

/// How loud a tone is in a part of a channel, as the peak of a sine.
inline double toneIn(const std::vector<float>& samples, int rate, double frequency, std::size_t from, std::size_t until)
{
    double sine = 0;
    double cosine = 0;
    until = std::min(until, samples.size());
    for (std::size_t i = from; i < until; ++i) {
        const double angle = 2 * std::numbers::pi * frequency * static_cast<double>(i) / rate;
        sine += static_cast<double>(samples[i]) * std::sin(angle);
        cosine += static_cast<double>(samples[i]) * std::cos(angle);
    }
    return until > from ? 2 * std::hypot(sine, cosine) / static_cast<double>(until - from) : 0;
}

inline Signal tone(double frequency, double level)
{
    return [=](double seconds, int) { return level * std::sin(2 * std::numbers::pi * frequency * seconds); };
}

/// Sound that is nowhere like itself a little later: what is out of place by a sample is seen.
Signal speechLike(double level);
/// The same without anything that would make an encoder change its windows.
Signal humming(double level);

} // namespace tests

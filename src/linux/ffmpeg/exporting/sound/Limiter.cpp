#include "linux/ffmpeg/exporting/sound/Limiter.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace ffmpeg {

namespace {

constexpr double kReach = 0.005;   ///< seconds
constexpr int kPlaces = 4;         ///< looked at from one sample to the next
constexpr std::size_t kBlock = 32; ///< samples that are looked at together, to pass by what is quiet

/// The sum of a running window's values, exact where all of them are 1.
std::vector<float> smoothed(const std::vector<float>& values, std::size_t reach)
{
    const std::size_t width = 2 * reach + 1;
    std::vector<float> means(values.size() - 2 * reach);
    double sum = 0;
    std::size_t lowered = 0;
    for (std::size_t i = 0; i < values.size(); ++i) {
        sum += 1 - static_cast<double>(values[i]);
        lowered += values[i] < 1;
        if (i >= width) {
            sum -= 1 - static_cast<double>(values[i - width]);
            lowered -= values[i - width] < 1;
        }
        if (lowered == 0)
            sum = 0;
        if (i + 1 >= width)
            means[i + 1 - width] = lowered == 0 ? 1.0f : static_cast<float>(1 - sum / static_cast<double>(width));
    }
    return means;
}

std::vector<float> lowest(const std::vector<float>& values, std::size_t reach)
{
    const std::size_t width = 2 * reach + 1;
    std::vector<float> minima(values.size() - 2 * reach);
    std::vector<std::size_t> candidates(values.size()); // of rising values; [head, tail)
    std::size_t head = 0;
    std::size_t tail = 0;
    for (std::size_t i = 0; i < values.size(); ++i) {
        while (tail > head && values[candidates[tail - 1]] >= values[i])
            --tail;
        candidates[tail++] = i;
        if (candidates[head] + width <= i)
            ++head;
        if (i + 1 >= width)
            minima[i + 1 - width] = values[candidates[head]];
    }
    return minima;
}

} // namespace

Limiter::Limiter(int rate, int channels)
    : m_reach(static_cast<std::size_t>(std::lround(kReach * rate)) / 2 * 2),
      m_samples(static_cast<std::size_t>(channels), std::vector<float>(2 * m_reach, 0.0f)), m_allowed(2 * m_reach, 1.0f)
{
    double loudest = 1;
    for (int place = 1; place < kPlaces; ++place) {
        std::vector<float> filter;
        double sum = 0;
        for (std::size_t tap = 0; tap < kTaps; ++tap) {
            const double x = static_cast<double>(tap) - (kTaps / 2.0 - 1) - static_cast<double>(place) / kPlaces;
            const double window = 0.5 + 0.5 * std::cos(std::numbers::pi * x / (kTaps / 2.0));
            const double value = std::sin(std::numbers::pi * x) / (std::numbers::pi * x) * window;
            filter.push_back(static_cast<float>(value));
            sum += std::abs(value);
        }
        loudest = std::max(loudest, sum);
        m_filters.push_back(std::move(filter));
    }
    m_quiet = static_cast<float>(static_cast<double>(kCeiling) / loudest);
}

void Limiter::findPeaks(std::size_t from, std::size_t until)
{
    m_allowed.resize(until, 1.0f);
    const auto allow = [&](std::size_t sample, float peak) {
        if (peak > kCeiling)
            m_allowed[sample] = std::min(m_allowed[sample], kCeiling / peak);
    };
    for (const auto& plane : m_samples) {
        for (std::size_t block = from; block < until; block += kBlock) {
            const std::size_t end = std::min(block + kBlock, until);
            const auto isLoud = [&](float sample) { return std::abs(sample) > m_quiet; };
            if (std::none_of(plane.begin() + static_cast<std::ptrdiff_t>(block - kTaps / 2),
                             plane.begin() + static_cast<std::ptrdiff_t>(end + kTaps / 2), isLoud))
                continue;
            // A peak between two samples counts for both; so the one before the first is looked at again.
            for (std::size_t i = block - 1; i < end; ++i) {
                float peak = std::abs(plane[i]);
                float between = 0;
                for (const auto& filter : m_filters) {
                    float value = 0;
                    for (std::size_t tap = 0; tap < kTaps; ++tap)
                        value += filter[tap] * plane[i + tap - (kTaps / 2 - 1)];
                    between = std::max(between, std::abs(value));
                }
                peak = std::max(peak, between);
                if (i >= block)
                    allow(i, peak);
                if (i + 1 < end)
                    allow(i + 1, between);
            }
        }
    }
}

Planes Limiter::push(const Planes& samples)
{
    m_affinity.assertHere();
    for (std::size_t channel = 0; channel < m_samples.size(); ++channel)
        m_samples[channel].insert(m_samples[channel].end(), samples[channel].begin(), samples[channel].end());
    const std::size_t known = m_samples.front().size();
    if (known < m_allowed.size() + kTaps / 2)
        return Planes(m_samples.size());
    findPeaks(m_allowed.size(), known - kTaps / 2);
    return give(m_allowed.size() - std::min(m_allowed.size(), 2 * m_reach));
}

Planes Limiter::give(std::size_t until)
{
    const std::size_t past = 2 * m_reach;
    Planes given(m_samples.size());
    if (until <= past)
        return given;
    for (std::size_t channel = 0; channel < m_samples.size(); ++channel)
        given[channel].assign(m_samples[channel].begin() + static_cast<std::ptrdiff_t>(past),
                              m_samples[channel].begin() + static_cast<std::ptrdiff_t>(until));
    if (std::any_of(m_allowed.begin(), m_allowed.end(), [](float gain) { return gain < 1; })) {
        // Lowest first, smoothed then, over the same reach in all: what a peak needs is held while it lasts.
        const auto gains = smoothed(smoothed(lowest(m_allowed, m_reach), m_reach / 2), m_reach / 2);
        for (auto& plane : given)
            for (std::size_t i = 0; i < plane.size(); ++i)
                plane[i] *= gains[i];
    }
    const auto done = static_cast<std::ptrdiff_t>(until - past);
    for (auto& plane : m_samples)
        plane.erase(plane.begin(), plane.begin() + done);
    m_allowed.erase(m_allowed.begin(), m_allowed.begin() + done);
    return given;
}

Planes Limiter::finish()
{
    m_affinity.assertHere();
    const std::size_t rest = m_samples.front().size() - 2 * m_reach;
    const Planes silence(m_samples.size(), std::vector<float>(2 * m_reach + kTaps / 2, 0.0f));
    Planes given = push(silence);
    for (auto& plane : given)
        plane.resize(rest);
    return given;
}

} // namespace ffmpeg

#include "linux/ffmpeg/exporting/sound/MixedSamples.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

namespace {

constexpr int kReadAtOnce = 1 << 15;

} // namespace

MixedSamples::MixedSamples(std::vector<std::unique_ptr<SampleSource>> tracks)
    : m_tracks(std::move(tracks)), m_limiter(rate(), channels()), m_ready(static_cast<std::size_t>(channels()))
{
}

int MixedSamples::read(Planes& into, int count)
{
    assertHere();
    const auto wanted = static_cast<std::size_t>(count);
    into.resize(m_ready.size());
    while (!m_hasEnded && m_ready.front().size() < wanted) {
        Planes sum(m_ready.size());
        for (const auto& track : m_tracks) {
            Planes samples;
            const int got = track->read(samples, kReadAtOnce);
            if (got < 0)
                return got;
            for (std::size_t channel = 0; channel < sum.size(); ++channel) {
                if (sum[channel].size() < samples[channel].size())
                    sum[channel].resize(samples[channel].size(), 0.0f);
                std::transform(samples[channel].begin(), samples[channel].end(), sum[channel].begin(),
                               sum[channel].begin(), [](float a, float b) { return a + b; });
            }
        }
        m_hasEnded = sum.front().size() < static_cast<std::size_t>(kReadAtOnce);
        const auto append = [&](const Planes& more) {
            for (std::size_t channel = 0; channel < more.size(); ++channel)
                m_ready[channel].insert(m_ready[channel].end(), more[channel].begin(), more[channel].end());
        };
        append(m_limiter.push(sum));
        if (m_hasEnded)
            append(m_limiter.finish());
    }
    const std::size_t got = std::min(wanted, m_ready.front().size());
    for (std::size_t channel = 0; channel < into.size(); ++channel) {
        const auto end = m_ready[channel].begin() + static_cast<std::ptrdiff_t>(got);
        into[channel].insert(into[channel].end(), m_ready[channel].begin(), end);
        m_ready[channel].erase(m_ready[channel].begin(), end);
    }
    return static_cast<int>(got);
}

void MixedSamples::detach()
{
    for (const auto& each : m_tracks)
        each->detach();
    m_limiter.detach();
    SampleSource::detach();
}

} // namespace ffmpeg

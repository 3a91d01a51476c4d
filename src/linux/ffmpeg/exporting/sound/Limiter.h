/// Keeps a sum of sounds from clipping: turns it down around what would be too loud, and touches nothing else. One
/// thread.
///
/// Its memory is short and known, so that the same sound is limited alike wherever reading began.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/exporting/sound/SampleSource.h"

#include <cstddef>
#include <vector>

namespace ffmpeg {

class Limiter {
public:
    /// What a wave may reach between the samples, too: -1 dB of full scale leaves room for what encoding adds.
    static constexpr float kCeiling = 0.891251f;

    Limiter(int rate, int channels);

    /// Takes samples and gives those that are ready: so many fewer as it must see ahead.
    Planes push(const Planes& samples);
    /// The rest.
    Planes finish();
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    static constexpr std::size_t kTaps = 12; ///< of the filter that finds peaks between samples (ITU-R BS.1770)

    void findPeaks(std::size_t from, std::size_t until);
    Planes give(std::size_t until);

    base::Affinity m_affinity;
    std::size_t m_reach;                       ///< samples to each side over which the gain changes: 5 ms
    float m_quiet;                             ///< samples below this have no peak between them that is too loud
    std::vector<std::vector<float>> m_filters; ///< one for each place between two samples
    Planes m_samples;                          ///< the first 2 * m_reach of them were given already
    std::vector<float> m_allowed; ///< the gain that the peaks at each sample allow, for those where it is known
};

} // namespace ffmpeg

/// The sum of several sound tracks, each at its own level, kept from clipping. One thread.
#pragma once

#include "linux/ffmpeg/exporting/sound/Limiter.h"
#include "linux/ffmpeg/exporting/sound/SampleSource.h"

#include <memory>
#include <vector>

namespace ffmpeg {

class MixedSamples final : public SampleSource {
public:
    /// All of one rate and with as many channels. It lasts as long as the longest of them.
    explicit MixedSamples(std::vector<std::unique_ptr<SampleSource>> tracks);

    int rate() const override
    {
        assertHere();
        return m_tracks.front()->rate();
    }
    int channels() const override
    {
        assertHere();
        return m_tracks.front()->channels();
    }
    int read(Planes& into, int count) override;
    void detach() override;

private:
    std::vector<std::unique_ptr<SampleSource>> m_tracks;
    Limiter m_limiter;
    Planes m_ready;
    bool m_hasEnded = false;
};

} // namespace ffmpeg

/// Encodes sound to AAC on all cores: in chunks, each by an encoder of its own that has heard what comes before, so that
/// the packets have the times of one encoder's and no seam is heard. Their bytes may be others. One thread calls; it
/// decodes while others encode.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/exporting/sound/SampleSource.h"
#include "linux/ffmpeg/exporting/sound/SoundEncoder.h"

#include <cstdint>
#include <deque>
#include <functional>
#include <future>
#include <memory>
#include <vector>

namespace ffmpeg {

class ChunkedEncoder {
public:
    struct Plan {
        std::int64_t framesInChunk; ///< of 1,024 samples
        unsigned workers;           ///< chunks that are encoded at once
    };
    /// A minute a chunk at most (half a core second of work, 23 MB of stereo), the same number for each core, and less
    /// where so many tracks are encoded at once that their samples would fill the memory.
    static Plan plan(std::int64_t samples, int rate, unsigned cores, std::size_t tracks);

    static base::Result<std::unique_ptr<ChunkedEncoder>> open(std::unique_ptr<SampleSource> source,
                                                              std::int64_t bitRate, Plan plan, Cancelled cancelled);
    ~ChunkedEncoder();

    /// An encoder like those that are used.
    const SoundEncoder& model() const
    {
        m_affinity.assertHere();
        return *m_model;
    }
    /// Times in samples; the first packet begins before 0, by the encoder's priming. False behind the last.
    base::Result<bool> next(AVPacket& packet);
    /// What its owner calls last before another thread goes on with it.
    void detach();

private:
    using Packets = std::vector<Owned<AVPacket>>;
    struct Chunk {
        std::int64_t start; ///< the first frame that is sent
        std::int64_t from;  ///< the first packet that is kept; packet i spans the frames i - 1 and i
        std::int64_t until;
        bool isLast;
        Planes samples;
    };

    ChunkedEncoder(std::unique_ptr<SampleSource> source, std::unique_ptr<SoundEncoder> model,
                   SoundEncoder::Settings settings, Plan plan, Cancelled cancelled);

    base::Result<void> startOne();
    static base::Result<Packets> encode(const SoundEncoder::Settings& settings, const Chunk& chunk,
                                        const std::function<bool()>& isUnwanted);

    base::Affinity m_affinity;
    std::unique_ptr<SampleSource> m_source;
    std::unique_ptr<SoundEncoder> m_model;
    SoundEncoder::Settings m_settings;
    Plan m_plan;
    Cancelled m_cancelled;
    std::shared_ptr<std::atomic<bool>> m_isGone = std::make_shared<std::atomic<bool>>(false);

    Planes m_samples; ///< read, from frame m_samplesStart on
    std::int64_t m_samplesStart = 0;
    std::int64_t m_begun = 0; ///< chunks
    bool m_hasEnded = false;
    std::deque<std::future<base::Result<Packets>>> m_running;
    std::deque<Owned<AVPacket>> m_ready;
};

} // namespace ffmpeg

/// The thread of a player that decodes sound ahead of the device, and starts and stops the device.
///
/// Asked by the thread that made it; cancelled and destroyed on any.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/AudioOutput.h"
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/SoundMixer.h"
#include "linux/ffmpeg/SoundRing.h"

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <thread>

namespace ffmpeg {

class SoundWorker {
public:
    /// Called on the worker's thread when what start() asked for is heard; null when nothing can be.
    using Started = std::function<void(std::uint64_t generation, std::shared_ptr<const AudioOutput> output)>;

    SoundWorker(std::shared_ptr<const Movie> movie, MakeAudioOutput makeOutput, Started started);
    /// Waits for the thread, which ends soon after cancel().
    ~SoundWorker();
    void cancel();

    /// Plays from this frame of the movie on, in pairs of samples.
    void start(std::uint64_t generation, std::int64_t frame);
    /// The pictures are at this frame already: what the device asks for next is not from before it.
    void hurryTo(std::int64_t frame)
    {
        m_affinity.assertHere();
        m_ring.hurryTo(frame);
    }
    /// Frames that were left out for that since the start, beside those that the device was given.
    std::int64_t skipped() const
    {
        m_affinity.assertHere();
        return m_ring.skipped();
    }
    /// Silence at once; the device goes soon after.
    void stop();

private:
    void loop();
    void begin(SoundMixer* mixer, std::uint64_t generation, std::int64_t frame);
    void fillRing(SoundMixer& mixer, std::size_t atMost);

    base::Affinity m_affinity; ///< of who asks
    const std::shared_ptr<const Movie> m_movie;
    const MakeAudioOutput m_makeOutput;
    const Started m_started;
    const std::shared_ptr<std::atomic<bool>> m_cancelled = std::make_shared<std::atomic<bool>>(false);

    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::uint64_t m_generation = 0; ///< grows with each request
    std::uint64_t m_wanted = 0;     ///< the player's generation of the latest start
    std::int64_t m_frame = 0;
    bool m_plays = false;
    std::atomic<bool> m_muted{true};

    static constexpr std::size_t kRing = std::size_t{2} * kSampleRate; ///< frames

    // The thread's own, but for the ring's reading end, which is the device's.
    base::Affinity m_inside = base::Affinity::detached();
    SoundRing m_ring{kRing};
    std::shared_ptr<AudioOutput> m_output;

    std::thread m_thread;
};

} // namespace ffmpeg

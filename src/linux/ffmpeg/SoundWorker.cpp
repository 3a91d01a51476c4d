#include "linux/ffmpeg/SoundWorker.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <utility>

namespace ffmpeg {

namespace {

constexpr std::size_t kChunk = 1024; ///< frames mixed at a time
/// Ready before the device starts: more than it asks for at once.
constexpr std::size_t kPrefill = kFramesAhead + kSampleRate / 10;
/// The ring holds more than a second: this often is enough to keep it filled.
constexpr std::chrono::milliseconds kFillInterval{100};
constexpr std::size_t kLowRoom = kSampleRate / 2; ///< as soon as there is more, the ring is filled

} // namespace

SoundWorker::SoundWorker(std::shared_ptr<const Movie> movie, MakeAudioOutput makeOutput, Started started)
    : m_movie(std::move(movie)), m_makeOutput(std::move(makeOutput)), m_started(std::move(started)),
      m_thread([this] { loop(); })
{
}

SoundWorker::~SoundWorker()
{
    cancel();
    m_thread.join();
}

void SoundWorker::cancel()
{
    m_muted = true;
    {
        const std::lock_guard lock(m_mutex);
        *m_cancelled = true;
    }
    m_changed.notify_all();
}

void SoundWorker::start(std::uint64_t generation, std::int64_t frame)
{
    m_affinity.assertHere();
    {
        const std::lock_guard lock(m_mutex);
        ++m_generation;
        m_wanted = generation;
        m_frame = frame;
        m_plays = true;
    }
    m_changed.notify_all();
}

void SoundWorker::stop()
{
    m_affinity.assertHere();
    m_muted = true;
    {
        const std::lock_guard lock(m_mutex);
        ++m_generation;
        m_plays = false;
    }
    m_changed.notify_all();
}

void SoundWorker::loop()
{
    m_inside.assertHere();
    auto mixer = SoundMixer::open(m_movie, m_cancelled);
    SoundMixer* const opened = mixer ? mixer.value().get() : nullptr;
    std::uint64_t done = 0;
    for (;;) {
        std::uint64_t wanted = 0;
        std::int64_t frame = 0;
        bool plays = false;
        bool isNew = false;
        {
            std::unique_lock lock(m_mutex);
            const auto hasWork = [&] {
                return *m_cancelled || done != m_generation || (m_output && m_ring.room() > kLowRoom);
            };
            if (m_output)
                m_changed.wait_for(lock, kFillInterval, hasWork);
            else
                m_changed.wait(lock, hasWork);
            if (*m_cancelled)
                break;
            isNew = std::exchange(done, m_generation) != m_generation;
            wanted = m_wanted;
            frame = m_frame;
            plays = m_plays;
        }
        if (isNew) {
            m_output.reset(); // before the ring is touched: the device reads it
            if (plays)
                begin(opened, wanted, frame);
        }
        if (m_output && opened)
            fillRing(*opened, kRing);
    }
    m_output.reset();
}

void SoundWorker::begin(SoundMixer* mixer, std::uint64_t generation, std::int64_t frame)
{
    m_inside.assertHere();
    if (mixer) {
        mixer->seek(frame);
        m_ring.reset(frame);
        fillRing(*mixer, kPrefill);
        {
            const std::lock_guard lock(m_mutex);
            m_muted = !m_plays || m_wanted != generation;
        }
        if (!m_muted) {
            m_output = m_makeOutput([this](float* samples, std::size_t frames) {
                if (m_muted) {
                    std::fill(samples, samples + frames * 2, 0.0f);
                    return;
                }
                m_ring.read(samples, frames);
                if (m_ring.room() > kLowRoom)
                    m_changed.notify_all(); // a wake-up that is missed is made up for by the interval
            });
        }
    }
    m_started(generation, m_output);
}

void SoundWorker::fillRing(SoundMixer& mixer, std::size_t atMost)
{
    m_inside.assertHere();
    std::array<float, kChunk * 2> chunk{};
    for (std::size_t filled = 0; filled < atMost && m_ring.room() >= kChunk && !*m_cancelled; filled += kChunk) {
        const std::int64_t from = m_ring.next();
        if (from > mixer.position() + kSampleRate)
            mixer.seek(from);
        while (mixer.position() + static_cast<std::int64_t>(kChunk) <= from)
            mixer.mix(chunk.data(), kChunk); // too late to be heard
        mixer.mix(chunk.data(), kChunk);
        m_ring.write(mixer.position() - static_cast<std::int64_t>(kChunk), chunk.data(), kChunk);
    }
}

} // namespace ffmpeg

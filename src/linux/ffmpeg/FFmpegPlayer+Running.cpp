// From play() to running, and what happens while time goes on.

#include "linux/ffmpeg/FFmpegPlayer.h"

#include <algorithm>
#include <chrono>
#include <utility>

namespace ffmpeg {

using base::MediaTime;

namespace {

/// A sound server that does not answer for so long is not waited for.
constexpr base::Instant kPatience = std::chrono::seconds(2);
/// The device's time is not the clock's; it is asked again at most this often, and at least that often.
constexpr base::Instant kShortestWait = std::chrono::milliseconds(1);
constexpr base::Instant kLongestWait = std::chrono::milliseconds(100);

} // namespace

void FFmpegPlayer::start()
{
    silence();
    ++m_generation;
    ++m_tickSerial;
    m_running = false;
    m_awaitsPictures = m_pictures != nullptr;
    if (m_pictures) {
        m_pictures->play(m_generation, m_movie->video()->tickAt(m_target));
        return;
    }
    m_engine->system.mainQueue.post([weak = weakSelf<FFmpegPlayer>(), generation = m_generation] {
        const auto self = weak.lock();
        if (self && self->m_generation == generation)
            self->startSound();
    });
}

void FFmpegPlayer::picturesArrived(std::uint64_t generation, const FrameRef& frame)
{
    if (generation != m_generation)
        return;
    const auto keepAlive = shared_from_this();
    if (frame) {
        setFrame(frame);
        if (generation != m_generation)
            return;
    }
    if (m_running) {
        tick();
    } else if (m_playing) {
        if (std::exchange(m_awaitsPictures, false))
            startSound();
    } else {
        m_settled = !frame || !frame->isReduced();
    }
}

bool FFmpegPlayer::hasPictures() const
{
    assertHere();
    return !m_pictures || m_pictures->isAhead();
}

/// Pictures are there. Sound starts behind them, so that time never has to jump.
void FFmpegPlayer::startSound()
{
    base::MainQueue& main = m_engine->system.mainQueue;
    if (m_movie->audioStreams().empty() || !m_engine->options.audioOutput) {
        run();
        return;
    }
    const auto weak = weakSelf<FFmpegPlayer>();
    if (!m_sound) {
        const auto started = [weak, &main](std::uint64_t generation, const std::shared_ptr<const AudioOutput>& output) {
            // The output weakly: a message that is never delivered must not keep it, because it calls the worker.
            main.post([weak, generation, silent = !output, device = std::weak_ptr(output)] {
                const auto self = weak.lock();
                if (self && (silent || !device.expired()))
                    self->soundStarted(generation, device.lock());
            });
        };
        m_sound = std::make_unique<SoundWorker>(m_movie, m_engine->options.audioOutput, started);
    }
    m_sound->start(m_generation, m_position.convertedTo(kSampleRate).value);
    main.postAfter(kPatience, [weak, generation = m_generation] {
        const auto self = weak.lock();
        if (self && generation == self->m_generation && self->m_playing && !self->m_running)
            self->run(); // the sound may still come
    });
}

void FFmpegPlayer::soundStarted(std::uint64_t generation, std::shared_ptr<const AudioOutput> output)
{
    if (generation != m_generation || !m_playing || m_output)
        return;
    if (!m_running) {
        m_output = std::move(output);
        run();
    } else if (output) {
        // Too late for the start: from here on it is heard.
        m_sound->hurryTo(currentTime().convertedTo(kSampleRate).value);
        const std::int64_t gone = (currentTime() - m_position).convertedTo(kSampleRate).value;
        m_soundClock.start(gone, m_engine->system.clock.now(), true);
        m_output = std::move(output);
        tick();
    }
}

/// Since it runs.
std::int64_t FFmpegPlayer::framesHeard() const
{
    return m_soundClock.frames(m_output->framesHeard() + m_sound->skipped(), m_engine->system.clock.now());
}

/// A device that does nothing shall go on with the pictures, should it come back.
void FFmpegPlayer::hurrySound()
{
    const std::int64_t heard = framesHeard();
    if (m_soundClock.isOnItsOwn())
        m_sound->hurryTo(m_position.convertedTo(kSampleRate).value + heard);
}

void FFmpegPlayer::silence()
{
    m_output = nullptr;
    if (m_sound)
        m_sound->stop();
}

void FFmpegPlayer::run()
{
    m_startedAt = m_engine->system.clock.now();
    m_soundClock.start(0, m_startedAt, false);
    m_toldTo = m_position;
    m_running = true;
    tick();
}

/// Stops time where it is. Whoever calls then says what the workers do.
void FFmpegPlayer::halt()
{
    m_target = m_position = currentTime();
    m_running = false;
    silence();
    ++m_generation;
    ++m_tickSerial;
}

void FFmpegPlayer::tick()
{
    const auto keepAlive = shared_from_this();
    const std::uint64_t generation = m_generation;
    // Whoever is called can pause or seek: then this run is over.
    const auto isOver = [&] { return generation != m_generation || !m_running; };
    if (m_output)
        hurrySound();
    const MediaTime now = currentTime();
    if (m_pictures) {
        if (const FrameRef due = m_pictures->takeDue(m_movie->video()->tickAt(now))) {
            setFrame(due);
            if (isOver())
                return;
        }
    }
    m_observers.played(std::exchange(m_toldTo, now), now);
    const bool isAtEnd = now >= m_movie->duration();
    if (isOver()) {
        // Who pauses there has not kept the movie from ending.
        if (isAtEnd && !m_playing && m_position >= m_movie->duration())
            tellEnd();
        return;
    }
    if (isAtEnd)
        reachEnd();
    else
        scheduleTick();
}

void FFmpegPlayer::scheduleTick()
{
    const MediaTime now = currentTime();
    MediaTime next = m_movie->duration();
    const auto consider = [&](MediaTime time) {
        if (time < next)
            next = time;
    };
    if (m_pictures) {
        if (const auto due = m_pictures->nextDue())
            consider(m_movie->video()->timeOf(*due));
    }
    if (const auto due = m_observers.nextAfter(m_toldTo))
        consider(*due);
    if (next < now)
        next = now;
    m_engine->system.mainQueue.postAfter(untilTick(next), [weak = weakSelf<FFmpegPlayer>(), serial = ++m_tickSerial] {
        const auto self = weak.lock();
        if (self && self->m_running && self->m_tickSerial == serial)
            self->tick();
    });
}

/// Rounded up in both units, so that the time is there when the tick comes: a tick too early would have to come again.
base::Instant FFmpegPlayer::untilTick(MediaTime next) const
{
    const std::int32_t timescale = m_movie->timescale();
    MediaTime ticks = next.convertedTo(timescale);
    if (ticks < next)
        ++ticks.value;
    if (m_output) {
        const MediaTime wait = ticks - currentTime();
        return std::clamp(base::Instant(wait.convertedTo(1'000'000'000).value), kShortestWait, kLongestWait);
    }
    const std::int64_t fromStart = ticks.value - m_position.convertedTo(timescale).value;
    const base::Instant due(av_rescale_rnd(fromStart, 1'000'000'000, timescale, AV_ROUND_UP));
    return std::max(base::Instant(0), m_startedAt + due - m_engine->system.clock.now());
}

void FFmpegPlayer::reachEnd()
{
    halt();
    m_target = m_position = m_movie->duration();
    if (m_actionAtItemEnd == platform::ActionAtItemEnd::Pause)
        m_playing = false;
    showPicture(); // the last one, which may not have come in time
    tellEnd();
}

void FFmpegPlayer::tellEnd()
{
    m_engine->center.post(platform::kPlayerItemDidPlayToEndNotification, m_item);
}

} // namespace ffmpeg

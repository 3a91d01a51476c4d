#include "linux/ffmpeg/FFmpegPlayer.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace ffmpeg {

using base::MediaTime;

std::shared_ptr<FFmpegPlayer> FFmpegPlayer::make(const std::shared_ptr<Engine>& engine,
                                                 std::shared_ptr<FFmpegPlayerItem> item)
{
    const std::shared_ptr<FFmpegPlayer> player(new FFmpegPlayer(engine, std::move(item)));
    if (player->m_item) {
        player->m_item->setTimeSource([raw = player.get()] { return raw->currentTime(); });
        player->m_item->ffmpegAsset()->whenLoaded([weak = player->weakSelf<FFmpegPlayer>()] {
            if (const auto self = weak.lock())
                self->movieLoaded();
        });
    }
    return player;
}

FFmpegPlayer::FFmpegPlayer(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegPlayerItem> item)
    : m_engine(std::move(engine)), m_item(std::move(item))
{
}

FFmpegPlayer::~FFmpegPlayer()
{
    assertHere();
    if (m_item)
        m_item->setTimeSource({});
    *m_left = true;
    m_output = nullptr;
    if (m_pictures)
        m_pictures->cancel();
    if (m_sound)
        m_sound->cancel();
    m_engine->retire(std::move(m_pictures));
    m_engine->retire(std::move(m_sound));
}

void FFmpegPlayer::movieLoaded()
{
    m_movie = m_item->ffmpegAsset()->movie();
    if (!m_movie)
        return;
    m_target = clamped(m_target);
    m_position = m_target.convertedTo(m_movie->timescale());
    const auto keepAlive = shared_from_this();
    if (const auto& video = m_movie->video()) {
        base::MainQueue& main = m_engine->system.mainQueue;
        m_pictures = std::make_unique<PictureWorker>(
            m_movie, [weak = weakSelf<FFmpegPlayer>(), &main](std::uint64_t generation, FrameRef frame,
                                                              PictureWorker::What what) {
                main.post([weak, generation, frame = std::move(frame), what] {
                    // Locked here: see FFmpegAsset::load().
                    const auto self = weak.lock();
                    if (self && what == PictureWorker::What::Glimpse)
                        self->glimpsed(generation, frame);
                    else if (self)
                        self->picturesArrived(generation, frame);
                });
            });
        if (video->tickAt(m_target) <= std::max(m_movie->firstFrame()->pts(), video->origin))
            setFrame(m_movie->firstFrame());
    }
    goTo(m_target);
    takeSteps();
}

base::MediaTime FFmpegPlayer::currentTime() const
{
    assertHere();
    if (!m_running)
        return m_position;
    const MediaTime elapsed =
        m_output ? MediaTime::make(framesHeard(), kSampleRate)
                 : MediaTime::make((m_engine->system.clock.now() - m_startedAt).count(), 1'000'000'000);
    const MediaTime now = m_position + elapsed.convertedTo(m_movie->timescale());
    return now < m_movie->duration() ? now : m_movie->duration();
}

base::MediaTime FFmpegPlayer::clamped(MediaTime time) const
{
    const MediaTime start = MediaTime::make(0, time.timescale);
    if (time < start)
        return start;
    return m_movie && time > m_movie->duration() ? m_movie->duration() : time;
}

void FFmpegPlayer::play()
{
    assertHere();
    if (m_playing)
        return;
    m_playing = true;
    m_steps = 0;
    if (m_movie)
        start();
}

void FFmpegPlayer::pause()
{
    assertHere();
    if (!m_playing)
        return;
    halt();
    m_playing = false;
    if (m_movie)
        goTo(m_position);
}

void FFmpegPlayer::seekToTime(MediaTime time)
{
    assertHere();
    if (!time.isNumeric())
        return;
    m_steps = 0;
    jumpTo(clamped(time));
}

void FFmpegPlayer::stepByCount(int frames)
{
    assertHere();
    pause();
    m_steps += frames;
    if (m_movie)
        takeSteps();
}

void FFmpegPlayer::takeSteps()
{
    if (m_steps == 0)
        return;
    if (!m_pictures) {
        m_steps = 0;
        return;
    }
    if (!m_index) {
        fetchIndex();
        return;
    }
    const VideoTrack& video = *m_movie->video();
    const auto picture = m_index->pictureFrom(video.tickAt(m_target), std::exchange(m_steps, 0));
    if (!picture)
        return;
    jumpTo(clamped(video.timeOf(*picture)));
}

void FFmpegPlayer::fetchIndex()
{
    if (std::exchange(m_fetchesIndex, true))
        return;
    base::MainQueue& main = m_engine->system.mainQueue;
    m_engine->opener.post([weak = weakSelf<FFmpegPlayer>(), &main, movie = m_movie, left = m_left]() mutable {
        auto index = *left ? nullptr : movie->packetIndex(left);
        main.post([weak, index = std::move(index), movie = std::move(movie)] {
            // Locked here: see FFmpegAsset::load().
            if (const auto self = weak.lock())
                self->indexArrived(index);
        });
    });
}

void FFmpegPlayer::indexArrived(std::shared_ptr<const PacketIndex> index)
{
    m_fetchesIndex = false;
    m_index = std::move(index);
    if (m_index)
        takeSteps();
    else
        m_steps = 0; // the file cannot be read any more
}

/// Stands there, as goTo() does, and tells the observers later.
void FFmpegPlayer::jumpTo(MediaTime time)
{
    goTo(time);
    m_engine->system.mainQueue.post([weak = weakSelf<FFmpegPlayer>()] {
        if (const auto self = weak.lock())
            self->m_observers.jumped(self->currentTime());
    });
}

/// Stands at `time`, which is within the movie, and goes on from there when it is playing.
void FFmpegPlayer::goTo(MediaTime time)
{
    m_running = false;
    silence();
    m_target = time;
    m_position = m_movie ? time.convertedTo(m_movie->timescale()) : time;
    if (!m_movie)
        return;
    if (m_playing)
        start();
    else
        showPicture();
}

void FFmpegPlayer::showPicture()
{
    m_settled = !m_pictures;
    if (m_pictures)
        m_pictures->show(++m_generation, m_movie->video()->tickAt(m_target));
}

/// What is nearer to the time that was asked for than what is shown takes its place for a moment.
void FFmpegPlayer::glimpsed(std::uint64_t generation, const FrameRef& frame)
{
    if (generation != m_generation || m_playing)
        return;
    const std::int64_t tick = m_movie->video()->tickAt(m_target);
    if (!m_frame || std::abs(frame->pts() - tick) < std::abs(m_frame->pts() - tick))
        setFrame(frame);
}

void FFmpegPlayer::setFrame(const FrameRef& frame)
{
    if (m_frame && m_frame->pts() == frame->pts() && m_frame->isReduced() == frame->isReduced())
        return;
    m_frame = frame;
    if (const auto handler = m_frameHandler)
        handler();
}

platform::Player::ObserverToken FFmpegPlayer::addPeriodicTimeObserver(MediaTime interval,
                                                                      std::function<void(MediaTime)> callback)
{
    assertHere();
    auto token = m_observers.addPeriodic(interval, std::move(callback));
    if (m_running)
        scheduleTick();
    return token;
}

platform::Player::ObserverToken FFmpegPlayer::addBoundaryTimeObserver(std::vector<MediaTime> times,
                                                                      std::function<void()> callback)
{
    assertHere();
    auto token = m_observers.addBoundary(std::move(times), std::move(callback));
    if (m_running)
        scheduleTick();
    return token;
}

} // namespace ffmpeg

/// Plays an item: the current picture, the sound, and who is told when. Main queue only.
///
/// Time goes on with what the sound device has played; where nothing is heard, with the system's clock, also while a device
/// does nothing. It stands still after play() and seeks until picture and sound are there, or one of them takes too long.
#pragma once

#include "linux/ffmpeg/Engine.h"
#include "linux/ffmpeg/FFmpegPlayerItem.h"
#include "linux/ffmpeg/PictureWorker.h"
#include "linux/ffmpeg/SoundClock.h"
#include "linux/ffmpeg/SoundWorker.h"
#include "platform/media/Player.h"
#include "platform/media/TimeObservers.h"

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>

namespace ffmpeg {

class FFmpegPlayer final : public platform::Player {
public:
    /// `item` may be null: then nothing is ever played.
    static std::shared_ptr<FFmpegPlayer> make(const std::shared_ptr<Engine>& engine,
                                              std::shared_ptr<FFmpegPlayerItem> item);
    ~FFmpegPlayer() override;

    std::shared_ptr<platform::PlayerItem> currentItem() const override { return here(m_item); }
    /// At the end of the item it ends again at once.
    void play() override;
    void pause() override;
    bool isPlaying() const override { return here(m_playing); }
    base::MediaTime currentTime() const override;
    void seekToTime(base::MediaTime time) override;
    void stepByCount(int frames) override;
    void setActionAtItemEnd(platform::ActionAtItemEnd action) override { here(m_actionAtItemEnd) = action; }
    ObserverToken addPeriodicTimeObserver(base::MediaTime interval,
                                          std::function<void(base::MediaTime)> callback) override;
    ObserverToken addBoundaryTimeObserver(std::vector<base::MediaTime> times, std::function<void()> callback) override;
    void removeTimeObserver(const ObserverToken& token) override { here(m_observers).remove(token); }
    platform::VideoFrameRef currentFrame() const override { return here(m_frame); }
    void setFrameHandler(std::function<void()> handler) override { here(m_frameHandler) = std::move(handler); }

    /// Whether time goes on: playing, and neither picture nor sound is waited for.
    bool isRunning() const { return here(m_running); }
    /// Paused, and the full picture for where it stands is shown (or there is none).
    bool isSettled() const { return !here(m_playing) && m_movie && m_settled && m_steps == 0; }
    /// While running: whether the next picture has been decoded, or there is none any more.
    bool hasPictures() const;

private:
    FFmpegPlayer(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegPlayerItem> item);

    // Loading and positions.
    void movieLoaded();
    base::MediaTime clamped(base::MediaTime time) const;
    void jumpTo(base::MediaTime time);
    void goTo(base::MediaTime time);
    void showPicture();
    void glimpsed(std::uint64_t generation, const FrameRef& frame);

    // Steps: they wait until it is known where the pictures are.
    void takeSteps();
    void fetchIndex();
    void indexArrived(std::shared_ptr<const PacketIndex> index);

    // From play() to running, and back.
    void start();
    void picturesArrived(std::uint64_t generation, const FrameRef& frame);
    void startSound();
    std::int64_t framesHeard() const;
    void soundStarted(std::uint64_t generation, std::shared_ptr<const AudioOutput> output);
    void silence();
    void run();
    void hurrySound();
    void halt();

    // While running.
    void tick();
    void scheduleTick();
    base::Instant untilTick(base::MediaTime next) const;
    void reachEnd();
    void tellEnd();
    void setFrame(const FrameRef& frame);

    std::shared_ptr<Engine> m_engine;
    std::shared_ptr<FFmpegPlayerItem> m_item;
    std::shared_ptr<Movie> m_movie;
    std::unique_ptr<PictureWorker> m_pictures; ///< null when there are none
    std::unique_ptr<SoundWorker> m_sound;      ///< null until it is needed
    /// What time goes by while running; null for the system's clock. Let go before the sound worker is told anything:
    /// the device must end on the worker's thread.
    std::shared_ptr<const AudioOutput> m_output;
    mutable SoundClock m_soundClock; ///< while running with an output

    platform::TimeObservers m_observers;
    FrameRef m_frame;
    std::function<void()> m_frameHandler;
    platform::ActionAtItemEnd m_actionAtItemEnd = platform::ActionAtItemEnd::Pause;

    std::shared_ptr<const PacketIndex> m_index; ///< null until steps need it
    bool m_fetchesIndex = false;
    int m_steps = 0; ///< asked for, and not taken yet
    const std::shared_ptr<std::atomic<bool>> m_left = std::make_shared<std::atomic<bool>>(false); ///< is going

    bool m_playing = false;
    bool m_running = false;
    bool m_awaitsPictures = false; ///< between play() and the first picture
    bool m_settled = false;
    base::MediaTime m_position = base::MediaTime::zero(); ///< where it stands, or from where it runs
    base::MediaTime m_target = base::MediaTime::zero();   ///< the same, as exactly as it was asked for
    base::MediaTime m_toldTo;                             ///< observers were told of all moments up to this
    base::Instant m_startedAt{0};
    std::uint64_t m_generation = 0; ///< grows with each seek, play and pause
    std::uint64_t m_tickSerial = 0; ///< only the latest scheduled tick counts
};

} // namespace ffmpeg

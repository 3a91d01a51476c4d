/// Movies, items and players in memory: what FakeMediaFramework makes. Main queue only.
#pragma once

#include "base/Queue.h"
#include "platform/media/Asset.h"
#include "platform/media/Player.h"
#include "platform/media/TimeObservers.h"
#include "runtime/NotificationCenter.h"
#include "support/CallListener.h"

#include <algorithm>
#include <functional>
#include <memory>
#include <optional>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

namespace tests {

/// One colour everywhere.
class FakeVideoFrame final : public platform::VideoFrame {
public:
    FakeVideoFrame(base::MediaTime time, base::Size size, std::uint32_t bgra = 0xff808080)
        : m_time(time), m_size(size), m_bgra(bgra)
    {
    }

    base::MediaTime time() const override { return m_time; }
    base::Size displaySize() const override { return m_size; }
    bool render(std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height, Quality) const override
    {
        for (int y = 0; y < height; ++y)
            for (int x = 0; x < width * 4; ++x)
                bgra[y * bytesPerRow + x] = static_cast<std::uint8_t>(m_bgra >> (x % 4 * 8));
        return true;
    }

private:
    base::MediaTime m_time;
    base::Size m_size;
    std::uint32_t m_bgra; ///< blue in the lowest byte
};

/// What a file holds: its duration and tracks, or why it cannot be opened.
struct FakeMovie {
    base::MediaTime duration = base::MediaTime::indefinite();
    std::vector<platform::AssetTrack> tracks;
    base::ErrorRef error;
    std::optional<platform::CutOff> cutOff; ///< of a movie that was cut off

    static FakeMovie lasting(double seconds, base::Size size = {1080, 1920}, int soundTracks = 1)
    {
        FakeMovie movie;
        movie.duration = base::MediaTime::fromSeconds(seconds, 600);
        const base::MediaTimeRange all{base::MediaTime::make(0, 600), movie.duration};
        movie.tracks.push_back({1, platform::MediaType::Video, size, {}, all});
        for (int i = 0; i < soundTracks; ++i)
            movie.tracks.push_back({2 + i, platform::MediaType::Audio, {}, {}, all});
        return movie;
    }
    static FakeMovie failing(base::ErrorRef why = base::Error::make("fake", -1, "The movie cannot be opened."))
    {
        FakeMovie movie;
        movie.error = std::move(why);
        return movie;
    }
};

class FakeAsset final : public platform::Asset {
public:
    FakeAsset(base::MainQueue& mainQueue, std::optional<base::Url> url) : m_mainQueue(mainQueue), m_url(std::move(url))
    {
    }

    const std::optional<base::Url>& url() const override { return m_url; }
    base::ErrorRef error() const override { return movie.error; }
    base::MediaTime duration() const override { return movie.duration; }
    std::vector<platform::AssetTrack> tracks() const override { return movie.tracks; }
    std::optional<platform::CutOff> cutOff() const override { return movie.cutOff; }
    void whenLoaded(std::function<void()> then) override
    {
        if (!movie.error && movie.tracks.empty()) {
            m_waiting.push_back(std::move(then));
            return;
        }
        m_mainQueue.post([weak = weakSelf<FakeAsset>(), then = std::move(then)] {
            if (const auto self = weak.lock())
                then();
        });
    }
    void load(FakeMovie known)
    {
        movie = std::move(known);
        for (const auto& then : std::exchange(m_waiting, {}))
            then();
    }

    FakeMovie movie; ///< as known so far

private:
    base::MainQueue& m_mainQueue;
    std::optional<base::Url> m_url;
    std::vector<std::function<void()>> m_waiting;
};

class FakePlayerItem final : public platform::PlayerItem {
public:
    explicit FakePlayerItem(std::shared_ptr<platform::Asset> asset) : m_asset(std::move(asset)) {}

    std::shared_ptr<platform::Asset> asset() const override { return m_asset; }
    Status status() const override { return m_status; }
    base::ErrorRef error() const override { return m_error; }
    base::MediaTime duration() const override { return m_duration; }
    base::MediaTime currentTime() const override { return time; }

    /// Tells the observers of "duration", then those of "status", at once. May be said again with another duration.
    void becomeReady(const FakeMovie& movie)
    {
        if (const auto asset = std::dynamic_pointer_cast<FakeAsset>(m_asset))
            asset->load(movie);
        m_duration = movie.duration;
        m_error = nullptr;
        time = base::MediaTime::make(time.convertedTo(movie.duration.timescale).value, movie.duration.timescale);
        change(Status::ReadyToPlay);
    }
    void becomeReady(double seconds) { becomeReady(FakeMovie::lasting(seconds)); }
    /// Tells the observers of "duration" only: the status is not known yet.
    void learnDuration(double seconds)
    {
        m_duration = FakeMovie::lasting(seconds).duration;
        didChangeValueForKey(kDurationKey);
    }
    /// Tells the observers of "status" only: the duration is known already, or not yet.
    void learnThatItIsReady()
    {
        m_status = Status::ReadyToPlay;
        didChangeValueForKey(kStatusKey);
    }
    void fail(base::ErrorRef why = FakeMovie::failing().error)
    {
        m_error = std::move(why);
        change(Status::Failed);
    }

    base::MediaTime time = base::MediaTime::make(0, 600);

private:
    void change(Status status)
    {
        const auto keepAlive = shared_from_this();
        m_status = status;
        if (status == Status::ReadyToPlay)
            didChangeValueForKey(kDurationKey);
        didChangeValueForKey(kStatusKey);
    }

    std::shared_ptr<platform::Asset> m_asset;
    Status m_status = Status::Unknown;
    base::ErrorRef m_error;
    base::MediaTime m_duration = base::MediaTime::indefinite();
};

class FakePlayer final : public platform::Player {
public:
    struct Call {
        enum class Kind { Play, Pause, Seek, Step } kind;
        base::MediaTime time; ///< of a seek, as it was asked for
        int frames = 0;       ///< of a step
    };

    FakePlayer(base::MainQueue& mainQueue, runtime::NotificationCenter& center, std::shared_ptr<FakePlayerItem> item,
               CallListenerRef listener = std::make_shared<CallListener>())
        : m_mainQueue(mainQueue), m_center(center), m_item(std::move(item)), m_listener(std::move(listener))
    {
    }

    std::shared_ptr<platform::PlayerItem> currentItem() const override { return m_item; }
    void play() override
    {
        note({Call::Kind::Play, {}}, "play");
        m_playing = true;
    }
    void pause() override
    {
        note({Call::Kind::Pause, {}}, "pause");
        m_playing = false;
    }
    bool isPlaying() const override { return m_playing; }
    base::MediaTime currentTime() const override { return m_item ? m_item->time : base::MediaTime::zero(); }
    void seekToTime(base::MediaTime time) override
    {
        note({Call::Kind::Seek, time}, "seek " + inSeconds(time));
        if (!time.isNumeric() || !m_item)
            return;
        jumpTo(clamped(time));
    }
    /// There are thirty pictures a second.
    void stepByCount(int frames) override
    {
        note({Call::Kind::Step, {}, frames}, "step " + std::to_string(frames));
        m_playing = false;
        if (!m_item || !m_item->duration().isNumeric())
            return;
        constexpr std::int32_t kRate = 30;
        const base::MediaTime now = currentTime();
        const base::MediaTime end = m_item->duration();
        const std::int64_t last = std::max<std::int64_t>(0, (end.value * kRate - 1) / end.timescale);
        const std::int64_t shown = std::min(last, now.value * kRate / now.timescale);
        jumpTo(clamped(base::MediaTime::make(std::clamp<std::int64_t>(shown + frames, 0, last), kRate)));
    }
    void setActionAtItemEnd(platform::ActionAtItemEnd action) override
    {
        (*m_listener)("action at end");
        actionAtItemEnd = action;
    }
    ObserverToken addPeriodicTimeObserver(base::MediaTime interval,
                                          std::function<void(base::MediaTime)> callback) override
    {
        (*m_listener)("observe every " + std::to_string(interval.value) + "/" + std::to_string(interval.timescale));
        return m_observers.addPeriodic(interval, std::move(callback));
    }
    ObserverToken addBoundaryTimeObserver(std::vector<base::MediaTime> times, std::function<void()> callback) override
    {
        std::string call = "observe";
        for (const base::MediaTime& time : times)
            call += " " + inSeconds(time);
        (*m_listener)(call);
        return m_observers.addBoundary(std::move(times), std::move(callback));
    }
    void removeTimeObserver(const ObserverToken& token) override
    {
        (*m_listener)("observe no longer");
        m_observers.remove(token);
    }
    platform::VideoFrameRef currentFrame() const override { return m_frame; }
    void setFrameHandler(std::function<void()> handler) override
    {
        (*m_listener)(handler ? "show" : "show no longer");
        m_frameHandler = std::move(handler);
    }

    // What a test does and asks.

    std::vector<Call> calls;
    /// As it was set. Where it was not, the end pauses.
    std::optional<platform::ActionAtItemEnd> actionAtItemEnd;

    std::vector<base::MediaTime> seeks() const
    {
        std::vector<base::MediaTime> times;
        for (const Call& call : calls)
            if (call.kind == Call::Kind::Seek)
                times.push_back(call.time);
        return times;
    }
    auto count(Call::Kind kind) const
    {
        return std::count_if(calls.begin(), calls.end(), [kind](const Call& call) { return call.kind == kind; });
    }
    bool hasObservers() const { return !m_observers.isEmpty(); }

    /// Plays on by `seconds` and calls, at once, everyone who waits for a moment on the way. Stops at the item's end,
    /// which is announced, also where a callback pauses there. Does nothing while paused; a callback that pauses or seeks
    /// ends the step there.
    void advance(double seconds)
    {
        const auto keepAlive = shared_from_this();
        const base::MediaTime target = currentTime() + base::MediaTime::fromSeconds(seconds, 600);
        const base::MediaTime end = m_item->duration();
        const base::MediaTime stop = end.isNumeric() && end < target ? end : target;
        const bool wasPlaying = m_playing;
        while (m_playing && currentTime() < stop) {
            const base::MediaTime from = currentTime();
            const auto next = m_observers.nextAfter(from);
            const base::MediaTime to = next && *next < stop ? *next : stop;
            m_item->time = to;
            m_observers.played(from, to);
            if (currentTime() != to)
                return;
        }
        if (wasPlaying && end.isNumeric() && currentTime() >= end)
            reachEnd();
    }
    /// Shows a picture, as when it was decoded.
    void show(platform::VideoFrameRef frame)
    {
        m_frame = std::move(frame);
        if (m_frameHandler)
            m_frameHandler();
    }

private:
    void note(const Call& call, const std::string& words)
    {
        (*m_listener)(words);
        calls.push_back(call);
    }
    static std::string inSeconds(base::MediaTime time)
    {
        std::ostringstream text;
        text << time.seconds();
        return text.str();
    }
    void jumpTo(base::MediaTime time)
    {
        m_item->time = time;
        m_mainQueue.post([weak = weakSelf<FakePlayer>()] {
            if (const auto self = weak.lock())
                self->m_observers.jumped(self->currentTime());
        });
    }
    base::MediaTime clamped(base::MediaTime time) const
    {
        const base::MediaTime end = m_item->duration();
        if (time < base::MediaTime::zero())
            time = base::MediaTime::zero();
        if (end.isNumeric() && time > end)
            time = end;
        return time.convertedTo(end.isNumeric() ? end.timescale : 600);
    }
    void reachEnd()
    {
        if (actionAtItemEnd.value_or(platform::ActionAtItemEnd::Pause) == platform::ActionAtItemEnd::Pause)
            m_playing = false;
        m_center.post(platform::kPlayerItemDidPlayToEndNotification, m_item);
    }

    base::MainQueue& m_mainQueue;
    runtime::NotificationCenter& m_center;
    std::shared_ptr<FakePlayerItem> m_item;
    CallListenerRef m_listener;
    platform::TimeObservers m_observers;
    platform::VideoFrameRef m_frame;
    std::function<void()> m_frameHandler;
    bool m_playing = false;
};

} // namespace tests

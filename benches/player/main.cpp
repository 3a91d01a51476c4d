// Clipsa's media engine without a window, told on standard input what to do: clipsa-bench-player MOVIE
//
//   seek SECONDS    to there; answered when the full picture is at hand
//   scrub SECONDS   the same, but any picture of that very moment will do
//   play SECONDS    for so long; answered with how many pictures were shown
// Each command, and the start, is answered with a line that begins with "ok".

#include "base/System.h"
#include "linux/ffmpeg/FFmpegMediaFramework.h"
#include "linux/ffmpeg/FFmpegPlayer.h"
#include "player/SilentOutput.h"

#include <cmath>
#include <condition_variable>
#include <cstdio>
#include <functional>
#include <iostream>
#include <mutex>
#include <sstream>
#include <string>

namespace {

constexpr base::Instant kPatience = std::chrono::seconds(30);
constexpr double kSameMoment = 0.002; // seconds; positions are asked for a little behind a picture's time

/// Runs the main queue on this thread until something has come true.
class Loop {
public:
    explicit Loop(base::MainQueue& queue, const base::Clock& clock) : m_queue(queue), m_clock(clock)
    {
        m_queue.setWake([this] {
            {
                const std::lock_guard lock(m_mutex);
                m_woken = true;
            }
            m_changed.notify_one();
        });
    }
    ~Loop() { m_queue.setWake({}); }

    /// False when it has not within `limit`.
    bool runUntil(const std::function<bool()>& done, base::Instant limit = kPatience)
    {
        const base::Instant end = m_clock.now() + limit;
        for (;;) {
            m_queue.runDue();
            if (done())
                return true;
            const base::Instant left = end - m_clock.now();
            if (left.count() <= 0)
                return false;
            std::unique_lock lock(m_mutex);
            m_changed.wait_for(lock, std::min(left, m_queue.untilNext().value_or(left)), [this] { return m_woken; });
            m_woken = false;
        }
    }

private:
    base::MainQueue& m_queue;
    const base::Clock& m_clock;
    std::mutex m_mutex;
    std::condition_variable m_changed;
    bool m_woken = false;
};

struct Machine {
    base::SystemClock clock;
    base::StreamLog log{stderr, base::StreamLog::Style::Plain, false};
    base::MainQueue mainQueue{clock};
    Loop loop{mainQueue, clock};
    base::WorkerQueue background;
    base::WorkerQueue standard;
    base::System system{log, clock, mainQueue, background, standard};
    runtime::NotificationCenter center;
    ffmpeg::FFmpegMediaFramework media{system, center, {{}, [](ffmpeg::AudioOutput::Fill fill) {
                                                            return std::make_unique<bench::SilentOutput>(
                                                                std::move(fill));
                                                        }}};
};

class Session {
public:
    Session(Machine& machine, const std::string& path)
        : m_machine(machine),
          m_item(machine.media.playerItemWithAsset(machine.media.assetWithURL(base::Url::fromPath(path)))),
          m_player(std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(machine.media.playerWithPlayerItem(m_item)))
    {
        m_player->setFrameHandler([this] { ++m_shown; });
    }

    bool open()
    {
        return m_machine.loop.runUntil([&] { return m_item->status() != platform::PlayerItem::Status::Unknown; })
               && m_item->status() == platform::PlayerItem::Status::ReadyToPlay
               && m_machine.loop.runUntil([&] { return m_player->isSettled(); });
    }

    bool carryOut(const std::string& command, double seconds, std::string& answer)
    {
        if (command == "seek") {
            seekTo(seconds);
            return m_machine.loop.runUntil([&] { return m_player->isSettled(); }) && shows(seconds);
        }
        if (command == "scrub") {
            seekTo(seconds);
            return m_machine.loop.runUntil([&] { return shows(seconds); });
        }
        if (command == "play") {
            const int before = m_shown;
            m_player->play();
            m_machine.loop.runUntil([] { return false; },
                                    std::chrono::duration_cast<base::Instant>(std::chrono::duration<double>(seconds)));
            answer = std::to_string(m_shown - before);
            m_player->pause();
            return m_machine.loop.runUntil([&] { return m_player->isSettled(); });
        }
        return false;
    }

private:
    void seekTo(double seconds) { m_player->seekToTime(base::MediaTime::fromSeconds(seconds, 1'000'000)); }

    bool shows(double seconds) const
    {
        const auto frame = m_player->currentFrame();
        return frame && std::abs(frame->time().seconds() - seconds) < kSameMoment;
    }

    Machine& m_machine;
    std::shared_ptr<platform::PlayerItem> m_item;
    std::shared_ptr<ffmpeg::FFmpegPlayer> m_player;
    int m_shown = 0;
};

} // namespace

int main(int argc, char* argv[])
{
    if (argc != 2) {
        std::fputs("usage: clipsa-bench-player MOVIE\n", stderr);
        return 2;
    }
    Machine machine;
    Session session(machine, argv[1]);
    bool well = session.open();
    std::cout << (well ? "ok" : "cannot open the movie") << std::endl;
    for (std::string line; well && std::getline(std::cin, line);) {
        std::istringstream words(line);
        std::string command;
        std::string answer;
        double seconds = 0;
        words >> command >> seconds;
        well = session.carryOut(command, seconds, answer);
        std::cout << (well ? "ok " + answer : "cannot " + line) << std::endl;
    }
    return well ? 0 : 1;
}

/// Reads the tracks of an exported movie by turns, on a thread of its own, a little ahead of whoever writes them: reading
/// is half of an export's work and writing the other.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/exporting/TrackSource.h"

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <mutex>
#include <optional>
#include <thread>
#include <vector>

namespace ffmpeg {

/// Belongs to the thread that makes it.
class TrackTurns {
public:
    struct Track {
        TrackSource* source;
        AVRational sourceTicks; ///< what its times are in
        AVRational ticks;       ///< what they are in when they come out
    };

    /// Packets of one track that follow each other, in the order of decoding.
    struct Turn {
        std::size_t track = 0;
        std::vector<Owned<AVPacket>> packets;
        bool isLast = false; ///< the track has no more
    };

    /// Until this has ended nobody else uses the sources; it detaches them at its beginning and at its end.
    explicit TrackTurns(const std::vector<Track>& tracks);
    ~TrackTurns();
    TrackTurns(const TrackTurns&) = delete;
    TrackTurns& operator=(const TrackTurns&) = delete;

    /// The turn of the track that is furthest behind; nothing when all have ended. An error of a track comes behind the
    /// turns before it, and is the last that comes.
    base::Result<std::optional<Turn>> next();

private:
    struct Reading {
        Track track;
        Owned<AVPacket> next; ///< null when none is left
        double seconds() const { return static_cast<double>(next->dts) * av_q2d(track.ticks); }
    };

    base::Result<void> readAll();
    static base::Result<void> fetch(Reading& reading);
    bool give(Turn turn);

    base::Affinity m_affinity;
    std::vector<Reading> m_readings; ///< the thread's
    std::deque<Turn> m_taken;        ///< of whoever calls next()

    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::deque<Turn> m_read;
    std::size_t m_bytes = 0; ///< in them
    bool m_isUnwanted = false;
    std::optional<base::Result<void>> m_end; ///< of the thread, as soon as it is there
    std::jthread m_thread;                   ///< the last member: it uses the others
};

} // namespace ffmpeg

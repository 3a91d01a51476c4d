/// The packets of a movie's pictures that were read and are not decoded yet: a look ahead tells which pictures nobody will
/// see, and which of those no other needs. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/images/H264References.h"

#include <cstdint>
#include <deque>
#include <memory>

namespace ffmpeg {

class PacketsAhead {
public:
    /// Packets: pictures are not reordered farther than that.
    static constexpr std::size_t kEnough = 17;

    explicit PacketsAhead(const AVStream& stream, std::size_t enough = kEnough)
        : m_enough(enough), m_references(H264References::of(*stream.codecpar))
    {
    }

    /// The next packet is one of another place.
    void restart();
    /// Reads until enough is there, or the movie ends.
    void fill(Demuxer& demuxer);
    /// The next one in the order of decoding.
    void add(Owned<AVPacket> packet);
    bool isEmpty() const
    {
        m_affinity.assertHere();
        return m_entries.empty();
    }
    const AVPacket& first() const
    {
        m_affinity.assertHere();
        return *m_entries.front().packet;
    }
    Owned<AVPacket> take();

    /// Whether the first takes part in no picture but its own, and that one is never seen by who wants what is visible at
    /// `tick` or later: a decoder may leave it out if no other refers to it.
    bool isFirstPassed(std::int64_t tick) const
    {
        m_affinity.assertHere();
        return isPassed(0, tick);
    }
    /// What can be decoded instead of the first, which nobody sees and no other needs, although it says that others refer
    /// to it. Null when it is needed. See H264References::standInFor().
    Owned<AVPacket> standInForFirst(std::int64_t tick, bool isWhole) const;

    /// Whether a picture that is shown behind `pts`, and not behind `tick`, is still to come.
    bool isAnyShown(std::int64_t pts, std::int64_t tick) const;

private:
    struct Entry {
        Owned<AVPacket> packet;
        H264References::Picture picture;
    };

    bool isPassed(std::size_t index, std::int64_t tick) const;

    base::Affinity m_affinity;
    const std::size_t m_enough;
    std::unique_ptr<H264References> m_references; ///< null where the stream does not tell
    std::deque<Entry> m_entries;
    bool m_readAll = false;
};

} // namespace ffmpeg

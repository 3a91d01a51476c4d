/// Reads a file's packets. One thread at a time; each reader of a movie has a demuxer of its own over the shared file.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/OpenFile.h"

#include <atomic>
#include <memory>
#include <optional>
#include <vector>

namespace ffmpeg {

struct PacketEntry;

/// Set by whoever no longer wants the result; reading then fails soon. Shared, because the reader may live longer.
using Cancelled = std::shared_ptr<const std::atomic<bool>>;

class Demuxer {
public:
    /// Reads the header, and as much more as it takes to know each stream's codec.
    /// Nothing but `file` is ever read, whatever the movie refers to.
    static base::Result<std::unique_ptr<Demuxer>> open(std::shared_ptr<OpenFile> file, Cancelled cancelled);
    ~Demuxer();

    const OpenFile& file() const
    {
        m_affinity.assertHere();
        return *m_file;
    }
    AVFormatContext& context()
    {
        m_affinity.assertHere();
        return *m_context;
    }
    AVStream& stream(int index)
    {
        m_affinity.assertHere();
        return *m_context->streams[index];
    }
    int streamCount() const
    {
        m_affinity.assertHere();
        return static_cast<int>(m_context->nb_streams);
    }
    bool isCancelled() const
    {
        m_affinity.assertHere();
        return m_cancelled && *m_cancelled;
    }
    /// Reads packets to know what headers do not tell, profiles for example; what was read comes all the same. Opening
    /// does that already for files without a header, and the library fails when it is asked twice.
    void lookAtPackets();
    /// From now on reading stops when this is set.
    void setCancelled(Cancelled cancelled)
    {
        m_affinity.assertHere();
        m_cancelled = std::move(cancelled);
    }

    /// Only the packets of these streams are read.
    void select(const std::vector<int>& streams);
    /// 0, AVERROR_EOF at the end or where the file is cut, or another error after which nothing more can be read.
    int read(AVPacket& packet);
    /// Why bytes could not be read since the last seek, as a negative errno; 0 while all could.
    int readError() const
    {
        m_affinity.assertHere();
        return m_readError;
    }
    /// To the last keyframe at or before `timestamp` of `stream` that is known; later ones may follow where the file has no
    /// table. False when there is none; the reader stands anywhere then.
    bool seek(int stream, std::int64_t timestamp);
    /// The same for sound, to `moment` in microseconds of the file's own time; `pictures` is the picture stream, or -1.
    bool seekSound(int sound, int pictures, std::int64_t moment);
    /// What is read next of `stream` is this packet, with the time that it has for who reads the file from its start.
    /// No other stream may be selected. False when it is not found; the reader stands anywhere then.
    bool seekTo(int stream, const PacketEntry& packet);
    /// To the first packet of all.
    bool seekToStart(int stream);
    // After seekTo() and seekToStart() streams and context may be others, of the same file: ask for them again.

    /// Whether the file's format has a table by which seek() goes, and tells in its header when the movie begins.
    bool seeksByTable() const;
    /// Whether that table has keyframes of `stream`; else a movie needs a PacketIndex. Of a reader that has read no packet
    /// yet; moves it.
    bool findsKeyframes(int stream);
    bool isMov() const;
    bool isMatroska() const;

    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    Demuxer(std::shared_ptr<OpenFile> file, Cancelled cancelled);

    enum class Way { ByPlace, BeforePlace, ByTime };

    int begin();
    void leave();
    bool startOver();
    void keepTable(AVFormatContext& before);
    bool seekToByte(std::int64_t position);
    bool go(Way way, int stream, const PacketEntry& packet);
    bool readUpTo(int stream, const PacketEntry& wanted);

    static int readBytes(void* self, std::uint8_t* into, int count);
    static std::int64_t moveTo(void* self, std::int64_t offset, int whence);

    base::Affinity m_affinity;
    std::shared_ptr<OpenFile> m_file;
    Cancelled m_cancelled;
    std::int64_t m_position = 0;
    int m_readError = 0;
    bool m_hasLookedAtPackets = false;
    Owned<AVIOContext> m_io;
    Owned<AVFormatContext> m_context;
    std::optional<std::vector<int>> m_selected; ///< all when nobody said
    bool m_isFresh = false;                     ///< no packet was read since the file was opened
    Owned<AVPacket> m_peeked;                   ///< read already
    int m_lost = 0;                             ///< why a reader that should start over could not
    Way m_way = Way::ByPlace;                   ///< that led to a packet before
};

} // namespace ffmpeg

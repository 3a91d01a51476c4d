/// Reads the packets of a movie's pictures in the order of decoding, from any place. One thread.
///
/// Packets keep the stream's own ticks, as its decoder wants them; outTick() makes them those of the output: on the
/// movie's time line, and as fine as all times that the movie tells. Packets that follow each other with one time, which
/// clocks of milliseconds make of pictures that came in a burst, get times of their own, a tick apart.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/bitstream/H264Headers.h"
#include "linux/ffmpeg/exporting/video/Splicer.h"
#include "linux/ffmpeg/exporting/video/VideoPlan.h"

#include <deque>
#include <memory>

namespace ffmpeg {

class PicturePackets {
public:
    /// No codec shows a picture later than so many that follow it: 16 is what H.264 and HEVC allow, of two fields each.
    static constexpr int kFarthestReorder = 33;

    /// `movie` has pictures.
    static base::Result<std::unique_ptr<PicturePackets>> open(std::shared_ptr<const Movie> movie, Cancelled cancelled);

    const Movie& movie() const
    {
        m_affinity.assertHere();
        return *m_movie;
    }
    const VideoTrack& track() const
    {
        m_affinity.assertHere();
        return *m_movie->video();
    }
    AVStream& stream()
    {
        m_affinity.assertHere();
        return m_demuxer->stream(track().stream);
    }
    AVFormatContext& context()
    {
        m_affinity.assertHere();
        return m_demuxer->context();
    }
    /// Whether the file's times of decoding are its own, and all times are exact.
    bool isMov() const
    {
        m_affinity.assertHere();
        return m_demuxer->isMov();
    }
    bool isCancelled() const
    {
        m_affinity.assertHere();
        return m_demuxer->isCancelled();
    }

    std::int64_t outTick(std::int64_t pts) const
    {
        m_affinity.assertHere();
        return (pts - track().origin) * m_scale;
    }
    /// A time span, in ticks of the output.
    std::int64_t outTicks(std::int64_t duration) const
    {
        m_affinity.assertHere();
        return duration * m_scale;
    }
    AVRational outTimeBase() const
    {
        m_affinity.assertHere();
        return {1, track().timescale};
    }

    /// AVI and ASF tell only when packets are decoded. From now on they are shown then.
    void setShowsInOrder()
    {
        m_affinity.assertHere();
        m_showsInOrder = true;
    }

    /// What is read next is a keyframe shown at or before this tick of the output, or the first packet of all: whoever
    /// decodes from there has all that is shown from this tick on as it should be.
    void seek(std::int64_t outTick);
    /// As Demuxer::read.
    int read(AVPacket& packet);

    /// The windows that planVideo() takes. The error says why times are not good enough to copy.
    base::Result<PacketWindow> headWindow(std::int64_t start, std::int64_t end, const Splicer& splicer);
    /// `from` is `end`, or earlier when that was not early enough.
    base::Result<PacketWindow> tailWindow(std::int64_t from, std::int64_t end, const Splicer& splicer);

    /// Whether an edit list leaves out pictures between such that it shows.
    bool isInterrupted();
    /// All that is copied, and what is hidden in between.
    base::Result<std::vector<PicturePacket>> copiedWindow(const VideoPlan& plan, const Splicer& splicer);
    /// What its owner calls last before another thread goes on with it.
    void detach();

private:
    PicturePackets(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer);

    void peek();
    std::vector<ByteView> unitsIn(const AVPacket& packet) const;
    std::uint32_t picturesUntilRefreshed() const;
    bool isRefreshed(std::uint32_t until, std::int64_t outTick);
    int readFile(AVPacket& packet);
    int readAsItIs(AVPacket& packet);
    int gatherOneTime();
    base::Result<PicturePacket> look(const AVPacket& packet, const Splicer& splicer) const;

    base::Affinity m_affinity;
    std::shared_ptr<const Movie> m_movie;
    std::unique_ptr<Demuxer> m_demuxer;
    std::int64_t m_scale;
    std::optional<h264::Configuration> m_h264; ///< nothing when it is another codec
    Owned<AVPacket> m_packet;
    Owned<AVPacket> m_peeked;
    bool m_hasPeeked = false;
    bool m_showsInOrder = false;
    std::deque<Owned<AVPacket>> m_ready; ///< of one time in the file
    Owned<AVPacket> m_next;              ///< what follows them
    int m_ended = 0;                     ///< or why nothing does
    bool m_startsMovie = false;
};

} // namespace ffmpeg

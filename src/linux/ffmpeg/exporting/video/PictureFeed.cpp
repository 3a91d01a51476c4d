#include "linux/ffmpeg/exporting/video/PictureFeed.h"

#include <limits>
#include <thread>
#include <utility>

namespace ffmpeg {

PictureFeed::PictureFeed(PicturePackets& packets, std::unique_ptr<VideoDecoder> decoder, std::int64_t skipBefore,
                         IsEnd isEnd)
    : m_packets(packets), m_decoder(std::move(decoder)), m_skipBefore(skipBefore), m_isEnd(std::move(isEnd)),
      m_packet(newPacket())
{
}

base::Result<std::unique_ptr<PictureFeed>> PictureFeed::start(PicturePackets& packets, std::int64_t from, Before before,
                                                              Size size, IsEnd isEnd)
{
    const int threads = static_cast<int>(std::thread::hardware_concurrency()) + 1;
    auto decoder = VideoDecoder::open(packets.stream(), packets.track(), threads, nullptr, size);
    if (!decoder)
        return decoder.error();
    packets.seek(from);
    return std::unique_ptr<PictureFeed>(
        new PictureFeed(packets, std::move(decoder).value(),
                        before == Before::Skip ? from : std::numeric_limits<std::int64_t>::min(), std::move(isEnd)));
}

base::Result<FrameRef> PictureFeed::next()
{
    m_affinity.assertHere();
    for (;;) {
        if (FrameRef frame = m_decoder->receive())
            return frame;
        if (m_finished)
            return FrameRef();
        const int result = m_packets.read(*m_packet);
        if (result == AVERROR_EXIT)
            return base::Error::make("ffmpeg", result, "it is no longer wanted");
        m_finished = result != 0 || m_isEnd(*m_packet);
        if (!m_finished) {
            const bool isTimed = m_packet->pts != AV_NOPTS_VALUE;
            m_decoder->setSkipsUnreferenced(isTimed && m_packets.outTick(m_packet->pts) < m_skipBefore);
            m_decoder->send(*m_packet);
            continue;
        }
        if (result == 0)
            m_end = std::exchange(m_packet, newPacket());
        m_decoder->finish();
    }
}

void PictureFeed::detach()
{
    m_decoder->detach();
    m_affinity.detach();
}

} // namespace ffmpeg

#include "linux/ffmpeg/exporting/video/PictureFeed.h"

#include <thread>
#include <utility>

namespace ffmpeg {

PictureFeed::PictureFeed(PicturePackets& packets, std::unique_ptr<VideoDecoder> decoder, IsEnd isEnd)
    : m_packets(packets), m_decoder(std::move(decoder)), m_isEnd(std::move(isEnd)), m_packet(newPacket())
{
}

base::Result<std::unique_ptr<PictureFeed>> PictureFeed::start(PicturePackets& packets, std::int64_t from, IsEnd isEnd)
{
    const int threads = static_cast<int>(std::thread::hardware_concurrency()) + 1;
    auto decoder = VideoDecoder::open(packets.stream(), packets.track(), threads);
    if (!decoder)
        return decoder.error();
    packets.seek(from);
    return std::unique_ptr<PictureFeed>(new PictureFeed(packets, std::move(decoder).value(), std::move(isEnd)));
}

base::Result<FrameRef> PictureFeed::next()
{
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
            m_decoder->send(*m_packet);
            continue;
        }
        if (result == 0)
            m_end = std::exchange(m_packet, newPacket());
        m_decoder->finish();
    }
}

} // namespace ffmpeg

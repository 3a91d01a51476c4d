#include "linux/ffmpeg/exporting/video/KeyframeSplicer.h"

#include "linux/ffmpeg/bitstream/HdrMetadata.h"
#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/CannotCopy.h"
#include "linux/ffmpeg/exporting/video/HiddenPictures.h"

#include <algorithm>

namespace ffmpeg {

namespace {

constexpr std::size_t kAv1ConfigurationBytes = 4; ///< of "av1C", before the sequence header
constexpr std::uint8_t kAv1Marker = 0x80;         ///< of "av1C"; without it there is the sequence header alone

/// VP9 has at least two columns of tiles where pictures are wider.
constexpr int kWidestVp9Tile = 4096;

/// The finest are nearly without loss.
constexpr QualityScale kVp9Quality{4, 16, 44, 10};
constexpr QualityScale kAv1Quality{6, 18, 46, 10};

int vp9Profile(AVPixelFormat format)
{
    const AVPixFmtDescriptor& about = *av_pix_fmt_desc_get(format);
    const bool is420 = about.log2_chroma_w == 1 && about.log2_chroma_h == 1;
    return (about.comp[0].depth > 8 ? 2 : 0) + (is420 ? 0 : 1);
}

} // namespace

base::Result<std::unique_ptr<Splicer>> KeyframeSplicer::make(const AVStream& stream, const AVFrame& picture)
{
    std::unique_ptr<KeyframeSplicer> splicer(new KeyframeSplicer);
    splicer->m_isAv1 = stream.codecpar->codec_id == AV_CODEC_ID_AV1;
    splicer->m_format = static_cast<AVPixelFormat>(picture.format);
    splicer->m_width = picture.width;
    splicer->m_height = picture.height;
    // The header of VP9 in MP4 has a number for this, but the muxer does not know it, and leaves the header empty.
    if (splicer->m_format == AV_PIX_FMT_YUV440P || splicer->m_format == AV_PIX_FMT_YUV440P10
        || splicer->m_format == AV_PIX_FMT_YUV440P12)
        return cannotCopy("MP4 does not hold VP9 whose colours are halved in height alone");
    if (splicer->m_isAv1) {
        const ByteView extradata = extradataOf(*stream.codecpar);
        const std::size_t start = !extradata.empty() && (extradata[0] & kAv1Marker) ? kAv1ConfigurationBytes : 0;
        if (extradata.size() <= start)
            return cannotCopy("its sequence header is neither in the file's header nor in the first packet");
        splicer->m_header.assign(extradata.begin() + static_cast<std::ptrdiff_t>(start), extradata.end());
        splicer->m_hdrUnits = HdrMetadata::of(stream, picture).av1Units();
    }
    return std::unique_ptr<Splicer>(std::move(splicer));
}

bool KeyframeSplicer::isJoint(const AVPacket& keyframe) const
{
    assertHere();
    const auto pictures = m_isAv1 ? picturesOfAv1(payloadOf(keyframe)) : picturesOfVp9(payloadOf(keyframe));
    return pictures.startsGroup;
}

int KeyframeSplicer::picturesHeldBack(const AVPacket& packet) const
{
    assertHere();
    const auto pictures = m_isAv1 ? picturesOfAv1(payloadOf(packet)) : picturesOfVp9(payloadOf(packet));
    return pictures.hidden - pictures.shownAgain;
}

void KeyframeSplicer::see(const AVPacket& copied)
{
    assertHere();
    if (!(copied.flags & AV_PKT_FLAG_KEY))
        return;
    const auto pictures = picturesOfVp9(payloadOf(copied));
    if (std::int64_t{pictures.width} * pictures.height <= std::int64_t{m_width} * m_height)
        return;
    m_width = pictures.width;
    m_height = pictures.height;
}

base::Result<void> KeyframeSplicer::prepare(EncoderRequest& request, int /*reorderDepth*/)
{
    assertHere();
    // No picture before its time.
    if (m_isAv1) {
        // At this speed the encoder writes where nothing is when there are no colours.
        if (av_pix_fmt_desc_get(m_format)->nb_components == 1)
            return cannotCopy("no AV1 without colours can be encoded");
        request.encoder = "libaom-av1";
        request.scale = kAv1Quality;
        request.options = {{"usage", "realtime"}, {"cpu-used", "7"}, {"lag-in-frames", "0"}, {"row-mt", "1"}};
    } else {
        request.encoder = "libvpx-vp9";
        request.scale = kVp9Quality;
        request.profile = vp9Profile(m_format);
        // Threads write each column of tiles into a buffer that is too small for what is nearly without loss, unless its
        // colours are halved both ways; one column, or one thread, is written straight into the packet.
        if (request.width > kWidestVp9Tile)
            request.threads = 1;
        request.options = {{"tile-columns", "0"},  {"deadline", "realtime"}, {"cpu-used", "7"}, {"b", "0"},
                           {"lag-in-frames", "0"}, {"auto-alt-ref", "0"},    {"row-mt", "1"}};
    }
    return {};
}

base::Result<void> KeyframeSplicer::describe(AVCodecParameters& parameters)
{
    assertHere();
    // Not every container says it, and the muxer asks.
    parameters.format = m_format;
    parameters.width = m_width;
    parameters.height = m_height;
    if (!m_isAv1)
        parameters.profile = vp9Profile(m_format);
    parameters.codec_tag = m_isAv1 ? MKTAG('a', 'v', '0', '1') : MKTAG('v', 'p', '0', '9');
    return {};
}

/// Behind pictures of another encoder the header of the file alone is not enough, and what is said of light is forgotten.
base::Result<void> KeyframeSplicer::completeKeyframe(AVPacket& packet) const
{
    if (!m_isAv1 || !(packet.flags & AV_PKT_FLAG_KEY))
        return {};
    const ByteView payload = payloadOf(packet);
    const auto pictures = picturesOfAv1(payload);
    Bytes whole = pictures.hasHeader ? Bytes() : m_header;
    const auto behindHeader = payload.begin() + static_cast<std::ptrdiff_t>(pictures.bytesToHeader);
    whole.insert(whole.end(), payload.begin(), behindHeader);
    if (!pictures.saysHdr)
        whole.insert(whole.end(), m_hdrUnits.begin(), m_hdrUnits.end());
    whole.insert(whole.end(), behindHeader, payload.end());
    if (whole.size() == payload.size())
        return {};
    AVBufferRef* buffer = av_buffer_alloc(whole.size() + AV_INPUT_BUFFER_PADDING_SIZE);
    if (!buffer)
        return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
    std::fill_n(std::copy(whole.begin(), whole.end(), buffer->data), AV_INPUT_BUFFER_PADDING_SIZE, std::uint8_t{0});
    av_buffer_unref(&packet.buf);
    packet.buf = buffer;
    packet.data = buffer->data;
    packet.size = static_cast<int>(whole.size());
    return {};
}

base::Result<void> KeyframeSplicer::adoptCopied(AVPacket& packet)
{
    assertHere();
    return completeKeyframe(packet);
}

base::Result<void> KeyframeSplicer::adoptEncoded(AVPacket& packet)
{
    assertHere();
    return completeKeyframe(packet);
}

} // namespace ffmpeg

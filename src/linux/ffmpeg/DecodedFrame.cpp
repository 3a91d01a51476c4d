#include "linux/ffmpeg/DecodedFrame.h"

#include "linux/ffmpeg/ToneMap.h"

#include <algorithm>
#include <array>
#include <vector>

namespace ffmpeg {

namespace {

struct Plain {
    AVPixelFormat format;
    bool fullRange;
};

/// The old names that carry the range in the format, as format and range.
Plain plainFormat(const AVFrame& picture)
{
    const bool full = picture.color_range == AVCOL_RANGE_JPEG;
    switch (picture.format) {
    case AV_PIX_FMT_YUVJ420P:
        return {AV_PIX_FMT_YUV420P, true};
    case AV_PIX_FMT_YUVJ422P:
        return {AV_PIX_FMT_YUV422P, true};
    case AV_PIX_FMT_YUVJ444P:
        return {AV_PIX_FMT_YUV444P, true};
    case AV_PIX_FMT_YUVJ440P:
        return {AV_PIX_FMT_YUV440P, true};
    case AV_PIX_FMT_YUVJ411P:
        return {AV_PIX_FMT_YUV411P, true};
    default:
        return {static_cast<AVPixelFormat>(picture.format), full};
    }
}

int matrixOf(const AVFrame& picture)
{
    if (isOfPalette(static_cast<AVPixelFormat>(picture.format)))
        return SWS_CS_ITU601;
    switch (picture.colorspace) {
    case AVCOL_SPC_BT709:
        return SWS_CS_ITU709;
    case AVCOL_SPC_BT470BG:
    case AVCOL_SPC_SMPTE170M:
        return SWS_CS_ITU601;
    case AVCOL_SPC_SMPTE240M:
        return SWS_CS_SMPTE240M;
    case AVCOL_SPC_FCC:
        return SWS_CS_FCC;
    case AVCOL_SPC_BT2020_NCL:
    case AVCOL_SPC_BT2020_CL:
        return SWS_CS_BT2020;
    default:
        if (ToneMap::isNeededFor(picture))
            return SWS_CS_BT2020;
        // Who does not say follows the custom: high definition is BT.709.
        return picture.height >= 720 ? SWS_CS_ITU709 : SWS_CS_ITU601;
    }
}

/// Scalers are costly to make and belong to one thread; players, thumbnails and drawing each use few at a time.
class Scalers {
public:
    struct Key {
        int fromWidth, fromHeight, fromFormat, toWidth, toHeight, toFormat, flags, matrix;
        bool fullRange;
        bool operator==(const Key&) const = default;
    };

    SwsContext* get(const Key& key)
    {
        for (auto it = m_entries.begin(); it != m_entries.end(); ++it) {
            if (it->key == key) {
                std::rotate(m_entries.begin(), it, it + 1); // the latest first
                return m_entries.front().context.get();
            }
        }
        Owned<SwsContext> context(sws_getContext(
            key.fromWidth, key.fromHeight, static_cast<AVPixelFormat>(key.fromFormat), key.toWidth, key.toHeight,
            static_cast<AVPixelFormat>(key.toFormat), key.flags, nullptr, nullptr, nullptr));
        if (!context)
            return nullptr;
        const int* coefficients = sws_getCoefficients(key.matrix);
        sws_setColorspaceDetails(context.get(), coefficients, key.fullRange, coefficients, key.fullRange, 0, 1 << 16,
                                 1 << 16);
        if (m_entries.size() >= kKept)
            m_entries.pop_back();
        m_entries.insert(m_entries.begin(), {key, std::move(context)});
        return m_entries.front().context.get();
    }

private:
    static constexpr std::size_t kKept = 4;
    struct Entry {
        Key key;
        Owned<SwsContext> context;
    };
    std::vector<Entry> m_entries;
};

SwsContext* scaler(const AVFrame& picture, int width, int height, AVPixelFormat toFormat, int flags)
{
    thread_local Scalers scalers;
    const Plain plain = plainFormat(picture);
    if (!sws_isSupportedInput(plain.format))
        return nullptr;
    return scalers.get({picture.width, picture.height, plain.format, width, height, toFormat, flags, matrixOf(picture),
                        plain.fullRange});
}

constexpr int kLargest = 16384; ///< pixels; nothing that is drawn is larger

bool scale(SwsContext* context, const AVFrame& picture, std::uint8_t* target, std::ptrdiff_t stride, int height)
{
    std::uint8_t* const targets[4] = {target};
    const int strides[4] = {static_cast<int>(stride)};
    return sws_scale(context, picture.data, picture.linesize, 0, picture.height, targets, strides) == height;
}

bool hasAlpha(const AVFrame& picture)
{
    const AVPixFmtDescriptor* about = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(picture.format));
    return about && (about->flags & (AV_PIX_FMT_FLAG_ALPHA | AV_PIX_FMT_FLAG_PAL));
}

} // namespace

bool isOfPalette(AVPixelFormat format)
{
    constexpr std::array kFormats{AV_PIX_FMT_PAL8, AV_PIX_FMT_RGB8, AV_PIX_FMT_BGR8, AV_PIX_FMT_RGB4_BYTE,
                                  AV_PIX_FMT_BGR4_BYTE};
    return std::find(kFormats.begin(), kFormats.end(), format) != kFormats.end();
}

DecodedFrame::DecodedFrame(Owned<AVFrame> picture, std::int64_t pts, base::MediaTime time, Orientation orientation,
                           AVRational codedAspect)
    : m_picture(std::move(picture)), m_pts(pts), m_time(time), m_orientation(orientation), m_aspect(codedAspect)
{
    if (m_picture->sample_aspect_ratio.num > 0 && m_aspect.num <= 0)
        m_aspect = m_picture->sample_aspect_ratio;
    const base::Size upright = squareSize(m_picture->width, m_picture->height, m_aspect);
    m_displaySize = orientation.transpose ? base::Size{upright.height, upright.width} : upright;
    constexpr int kAlignment = 32; // of rows, as decoders lay them out
    const auto format = static_cast<AVPixelFormat>(m_picture->format);
    m_byteCount = static_cast<std::size_t>(
        std::max(0, av_image_get_buffer_size(format, m_picture->width, m_picture->height, kAlignment)));
}

bool DecodedFrame::renderMapped(SwsContext* context, std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width,
                                int height) const
{
    constexpr int kAlignment = 64; // of rows, for the scaler's sake
    const int rowBytes = FFALIGN(width * 2, kAlignment);
    const std::size_t planeBytes = static_cast<std::size_t>(rowBytes) * static_cast<std::size_t>(height);
    thread_local std::vector<std::uint8_t> planes;
    planes.resize(planeBytes * 3 + kAlignment);
    std::uint8_t* const targets[4] = {planes.data(), planes.data() + planeBytes, planes.data() + 2 * planeBytes};
    const int strides[4] = {rowBytes, rowBytes, rowBytes};
    if (sws_scale(context, m_picture->data, m_picture->linesize, 0, m_picture->height, targets, strides) != height)
        return false;
    const ToneMap map = ToneMap::of(*m_picture);
    for (int y = 0; y < height; ++y) {
        const auto row = [&](int plane) {
            return reinterpret_cast<const std::uint16_t*>(targets[plane] + std::ptrdiff_t(y) * rowBytes);
        };
        map.apply({row(2), row(0), row(1)}, bgra + y * bytesPerRow, width);
    }
    return true;
}

bool DecodedFrame::render(std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height, Quality quality) const
{
    if (!bgra || width <= 0 || height <= 0 || width > kLargest || height > kLargest
        || bytesPerRow < std::ptrdiff_t(width) * 4)
        return false;
    const int flags = quality == Quality::Exact ? SWS_BICUBIC | SWS_ACCURATE_RND | SWS_FULL_CHR_H_INT : SWS_BILINEAR;
    const int scaledWidth = m_orientation.transpose ? height : width;
    const int scaledHeight = m_orientation.transpose ? width : height;
    const bool isMapped = ToneMap::isNeededFor(*m_picture);
    SwsContext* context =
        scaler(*m_picture, scaledWidth, scaledHeight, isMapped ? ToneMap::kFormat : AV_PIX_FMT_BGRA, flags);
    if (!context)
        return false;
    thread_local std::vector<std::uint8_t> scaled;
    std::uint8_t* target = bgra;
    std::ptrdiff_t stride = bytesPerRow;
    if (!m_orientation.isIdentity()) {
        stride = std::ptrdiff_t(scaledWidth) * 4;
        scaled.resize(static_cast<std::size_t>(stride) * static_cast<std::size_t>(scaledHeight) + 64);
        target = scaled.data();
    }
    if (isMapped ? !renderMapped(context, target, stride, scaledWidth, scaledHeight)
                 : !scale(context, *m_picture, target, stride, scaledHeight))
        return false;
    if (!m_orientation.isIdentity())
        turn(m_orientation, target, stride, scaledWidth, scaledHeight, bgra, bytesPerRow);
    if (hasAlpha(*m_picture)) {
        for (int y = 0; y < height; ++y)
            for (int x = 0; x < width; ++x)
                bgra[y * bytesPerRow + std::ptrdiff_t(x) * 4 + 3] = 255;
    }
    return true;
}

FrameRef DecodedFrame::reduced(const FrameRef& frame, int limit)
{
    const AVFrame& from = frame->picture();
    const int longest = std::max(from.width, from.height);
    if (longest <= limit)
        return frame;
    const auto scaled = [&](int length) { return std::max(2, length * limit / longest / 2 * 2); };
    Owned<AVFrame> to = newFrame();
    to->width = scaled(from.width);
    to->height = scaled(from.height);
    to->format = AV_PIX_FMT_YUV420P;
    if (av_frame_get_buffer(to.get(), 0) < 0)
        return nullptr;
    SwsContext* context = scaler(from, to->width, to->height, AV_PIX_FMT_YUV420P, SWS_FAST_BILINEAR);
    if (!context || sws_scale(context, from.data, from.linesize, 0, from.height, to->data, to->linesize) != to->height)
        return nullptr;
    if (av_frame_copy_props(to.get(), &from) < 0)
        return nullptr;
    to->color_range = plainFormat(from).fullRange ? AVCOL_RANGE_JPEG : AVCOL_RANGE_MPEG;
    to->colorspace = static_cast<AVColorSpace>(matrixOf(from)); // the numbers are those of ISO 23091-2, as the scaler's
    const auto small = std::make_shared<DecodedFrame>(std::move(to), frame->m_pts, frame->m_time, frame->m_orientation,
                                                      frame->m_aspect);
    small->m_displaySize = frame->m_displaySize; // who lays it out must not see the difference
    small->m_reduced = true;
    return small;
}

} // namespace ffmpeg

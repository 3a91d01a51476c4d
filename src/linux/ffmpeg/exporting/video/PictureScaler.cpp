#include "linux/ffmpeg/exporting/video/PictureScaler.h"

#include "linux/ffmpeg/DecodedFrame.h"

#include <algorithm>
#include <array>
#include <cstdint>

namespace ffmpeg {

namespace {

base::ErrorRef noMemory()
{
    return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
}

/// The same picture without a palette.
base::Result<Owned<AVFrame>> plain(const AVFrame& picture)
{
    auto out = newFrame();
    out->format = AV_PIX_FMT_BGR24;
    out->width = picture.width;
    out->height = picture.height;
    if (av_frame_get_buffer(out.get(), 0) < 0 || av_frame_copy_props(out.get(), &picture) < 0)
        return noMemory();
    const Owned<SwsContext> context(sws_getContext(picture.width, picture.height,
                                                   static_cast<AVPixelFormat>(picture.format), picture.width,
                                                   picture.height, AV_PIX_FMT_BGR24, 0, nullptr, nullptr, nullptr));
    if (!context)
        return noMemory();
    sws_scale(context.get(), picture.data, picture.linesize, 0, picture.height, out->data, out->linesize);
    return out;
}

/// The same with its last column and row twice where it has fewer, so that they do not bleed into what is behind them.
base::Result<Owned<AVFrame>> extended(const AVFrame& picture, int width, int height)
{
    auto out = newFrame();
    out->format = picture.format;
    out->width = width;
    out->height = height;
    if (av_frame_get_buffer(out.get(), 0) < 0 || av_frame_copy_props(out.get(), &picture) < 0)
        return noMemory();
    const auto format = static_cast<AVPixelFormat>(picture.format);
    const auto bytes = static_cast<std::size_t>(av_pix_fmt_desc_get(format)->comp[0].depth + 7) / 8;
    for (int plane = 0; plane < 4 && out->data[plane]; ++plane) {
        const auto row = static_cast<std::size_t>(av_image_get_linesize(format, width, plane));
        const auto known = static_cast<std::size_t>(av_image_get_linesize(format, picture.width, plane));
        const int shift = plane == 1 || plane == 2 ? av_pix_fmt_desc_get(format)->log2_chroma_h : 0;
        const int knownRows = AV_CEIL_RSHIFT(picture.height, shift);
        for (int y = 0; y < AV_CEIL_RSHIFT(height, shift); ++y) {
            const std::uint8_t* from =
                picture.data[plane] + std::ptrdiff_t(std::min(y, knownRows - 1)) * picture.linesize[plane];
            std::uint8_t* to = out->data[plane] + std::ptrdiff_t(y) * out->linesize[plane];
            std::copy_n(from, known, to);
            for (std::size_t x = known; x < row; ++x)
                to[x] = to[x - bytes];
        }
    }
    return out;
}

} // namespace

AVPixelFormat formatForH264(AVPixelFormat source)
{
    constexpr std::array kFormats{AV_PIX_FMT_YUV420P,   AV_PIX_FMT_YUVJ420P, AV_PIX_FMT_YUV422P,   AV_PIX_FMT_YUVJ422P,
                                  AV_PIX_FMT_YUV444P,   AV_PIX_FMT_YUVJ444P, AV_PIX_FMT_YUV420P10, AV_PIX_FMT_YUV422P10,
                                  AV_PIX_FMT_YUV444P10, AV_PIX_FMT_NONE};
    if (std::find(kFormats.begin(), kFormats.end(), source) != kFormats.end())
        return source;
    return avcodec_find_best_pix_fmt_of_list(kFormats.data(), source, 0, nullptr);
}

AVPixelFormat formatForHdr(AVPixelFormat source)
{
    constexpr std::array kFormats{AV_PIX_FMT_YUV420P10, AV_PIX_FMT_YUV422P10, AV_PIX_FMT_YUV444P10,
                                  AV_PIX_FMT_YUV420P12, AV_PIX_FMT_YUV422P12, AV_PIX_FMT_YUV444P12,
                                  AV_PIX_FMT_NONE};
    if (std::find(kFormats.begin(), kFormats.end(), source) != kFormats.end())
        return source;
    return avcodec_find_best_pix_fmt_of_list(kFormats.data(), source, 0, nullptr);
}

bool isRgb(AVPixelFormat format)
{
    const AVPixFmtDescriptor* about = av_pix_fmt_desc_get(format);
    return about && (about->flags & (AV_PIX_FMT_FLAG_RGB | AV_PIX_FMT_FLAG_PAL));
}

base::Result<Owned<AVFrame>> PictureScaler::fit(const AVFrame& picture)
{
    m_affinity.assertHere();
    if (isOfPalette(static_cast<AVPixelFormat>(picture.format))) {
        auto same = plain(picture);
        return same ? fit(*same.value()) : std::move(same);
    }
    const auto format = static_cast<AVPixelFormat>(picture.format);
    if (picture.width == m_width && picture.height == m_height && format == m_format) {
        Owned<AVFrame> same(av_frame_clone(&picture));
        return same ? base::Result<Owned<AVFrame>>(std::move(same)) : noMemory();
    }
    if ((picture.width + 1) / 2 == m_width / 2 && (picture.height + 1) / 2 == m_height / 2 && format == m_format)
        return extended(picture, m_width, m_height);
    // Multiples of 4, so that they begin on whole samples of every plane.
    const double scale = std::min(double(m_width) / picture.width, double(m_height) / picture.height);
    const bool fills = std::abs(picture.width * scale - m_width) < 4 && std::abs(picture.height * scale - m_height) < 4;
    const int width = fills ? m_width : std::clamp(int(picture.width * scale) / 4 * 4, 4, m_width);
    const int height = fills ? m_height : std::clamp(int(picture.height * scale) / 4 * 4, 4, m_height);
    const int left = (m_width - width) / 2 / 4 * 4;
    const int top = (m_height - height) / 2 / 4 * 4;

    if (!m_scaler || m_fromWidth != picture.width || m_fromHeight != picture.height || m_fromFormat != picture.format) {
        m_scaler.reset(sws_getContext(picture.width, picture.height, format, width, height, m_format,
                                      SWS_BICUBIC | SWS_ACCURATE_RND | SWS_FULL_CHR_H_INT, nullptr, nullptr, nullptr));
        if (!m_scaler)
            return base::Error::make("ffmpeg", AVERROR(EINVAL), "its pictures cannot be converted");
        m_fromWidth = picture.width;
        m_fromHeight = picture.height;
        m_fromFormat = picture.format;
        const int* table = sws_getCoefficients(isRgb(format) ? m_matrix : picture.colorspace);
        const int full = picture.color_range == AVCOL_RANGE_JPEG;
        sws_setColorspaceDetails(m_scaler.get(), table, full, table, full, 0, 1 << 16, 1 << 16);
    }
    auto out = newFrame();
    out->format = m_format;
    out->width = m_width;
    out->height = m_height;
    if (av_frame_get_buffer(out.get(), 0) < 0 || av_frame_copy_props(out.get(), &picture) < 0)
        return noMemory();
    std::array<std::ptrdiff_t, 4> strides{};
    std::copy_n(out->linesize, 4, strides.begin());
    av_image_fill_black(out->data, strides.data(), m_format, picture.color_range, m_width, m_height);
    const AVPixFmtDescriptor& about = *av_pix_fmt_desc_get(m_format);
    std::array<std::uint8_t*, 4> to{};
    for (int plane = 0; plane < 4 && out->data[plane]; ++plane) {
        const bool isChroma = plane == 1 || plane == 2;
        const int x = isChroma ? left >> about.log2_chroma_w : left;
        const int y = isChroma ? top >> about.log2_chroma_h : top;
        const std::ptrdiff_t bytes = (about.comp[plane].depth + 7) / 8;
        to[static_cast<std::size_t>(plane)] = out->data[plane] + std::ptrdiff_t(y) * out->linesize[plane] + x * bytes;
    }
    sws_scale(m_scaler.get(), picture.data, picture.linesize, 0, picture.height, to.data(), out->linesize);
    return out;
}

} // namespace ffmpeg

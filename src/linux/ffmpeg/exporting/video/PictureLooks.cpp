#include "linux/ffmpeg/exporting/video/PictureLooks.h"

#include <cmath>
#include <cstring>
#include <span>

namespace ffmpeg {

namespace {

constexpr int kDotsApart = 8;

/// Eight bytes at a time: there are many.
void addTo(std::uint64_t& hash, std::span<const std::uint8_t> bytes)
{
    constexpr std::uint64_t kPrime = 1099511628211U;
    for (std::size_t at = 0; at < bytes.size(); at += sizeof hash) {
        std::uint64_t part = 0;
        std::memcpy(&part, &bytes[at], std::min(sizeof part, bytes.size() - at));
        hash = (hash ^ part) * kPrime;
        hash ^= hash >> 29;
    }
}

const std::uint8_t* rowOf(const AVFrame& picture, int plane, int y)
{
    return picture.data[plane] + std::ptrdiff_t(y) * picture.linesize[plane];
}

} // namespace

PictureLook PictureLook::of(const AVFrame& picture)
{
    PictureLook look;
    look.isDamaged = (picture.flags & AV_FRAME_FLAG_CORRUPT) || picture.decode_error_flags != 0;
    look.hash = (std::uint64_t(picture.width) << 32 | std::uint64_t(picture.height) << 12) + unsigned(picture.format);
    const auto format = static_cast<AVPixelFormat>(picture.format);
    const AVPixFmtDescriptor& about = *av_pix_fmt_desc_get(format);
    for (int plane = 0; plane < av_pix_fmt_count_planes(format); ++plane) {
        const bool isChroma = plane == 1 || plane == 2;
        const int rows = isChroma ? AV_CEIL_RSHIFT(picture.height, about.log2_chroma_h) : picture.height;
        const int bytes = av_image_get_linesize(format, picture.width, plane);
        for (int y = 0; y < rows && bytes > 0; ++y)
            addTo(look.hash, {rowOf(picture, plane, y), static_cast<std::size_t>(bytes)});
    }
    const AVComponentDescriptor& first = about.comp[0];
    for (int y = kDotsApart / 2; y < picture.height; y += kDotsApart) {
        for (int x = kDotsApart / 2; x < picture.width; x += kDotsApart) {
            const std::uint8_t* sample = rowOf(picture, first.plane, y) + std::ptrdiff_t(x) * first.step + first.offset;
            const int value = first.depth > 8 ? (sample[0] | sample[1] << 8) >> first.shift : sample[0];
            look.dots.push_back(static_cast<std::uint8_t>(value >> std::max(first.depth - 8, 0)));
        }
    }
    return look;
}

bool areAlike(const PictureLook& a, const PictureLook& b)
{
    constexpr double kAlike = 20; // dB: much more than any two pictures that have nothing in common
    if (a.dots.size() != b.dots.size())
        return false;
    double sum = 0;
    for (std::size_t i = 0; i < a.dots.size(); ++i)
        sum += std::pow(double(a.dots[i]) - b.dots[i], 2);
    return sum <= 255.0 * 255.0 * static_cast<double>(a.dots.size()) / std::pow(10, kAlike / 10);
}

base::Result<std::vector<PictureLook>> looksOf(const AVCodecParameters& parameters,
                                               const std::vector<Owned<AVPacket>>& packets)
{
    const auto failure = [](int error) {
        return base::Error::make("ffmpeg", error, "its pictures cannot be decoded: " + textOf(error));
    };
    const AVCodec* codec = avcodec_find_decoder(parameters.codec_id);
    const Owned<AVCodecContext> decoder(codec ? avcodec_alloc_context3(codec) : nullptr);
    if (!decoder)
        return failure(AVERROR_DECODER_NOT_FOUND);
    int error = avcodec_parameters_to_context(decoder.get(), &parameters);
    decoder->thread_count = 1;
    // What a file leaves out of pictures at their edges an encoder is given.
    decoder->width = decoder->height = 0;
    if (error >= 0)
        error = avcodec_open2(decoder.get(), codec, nullptr);
    if (error < 0)
        return failure(error);
    std::vector<PictureLook> looks;
    const auto frame = newFrame();
    const auto receive = [&] {
        while (avcodec_receive_frame(decoder.get(), frame.get()) >= 0)
            looks.push_back(PictureLook::of(*frame));
    };
    for (const auto& packet : packets) {
        avcodec_send_packet(decoder.get(), packet.get());
        receive();
    }
    avcodec_send_packet(decoder.get(), nullptr);
    receive();
    return looks;
}

} // namespace ffmpeg

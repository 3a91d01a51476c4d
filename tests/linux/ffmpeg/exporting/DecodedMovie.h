/// What a player would see of an exported movie: every picture, decoded by FFmpeg's libraries without our engine.
#pragma once

#include "linux/ffmpeg/Libraries.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

namespace tests {

struct DecodedPicture {
    double seconds = 0;
    double duration = 0;            ///< of its packet
    int number = -1;                ///< as painted: tests/movies/README.md
    std::vector<std::uint8_t> luma; ///< 8 bits a pixel
    std::uint64_t hash = 0;         ///< of all planes
};

/// Errors that FFmpeg's libraries log while this lives, in one test at a time.
class Complaints {
public:
    Complaints()
    {
        texts().clear();
        av_log_set_callback([](void*, int level, const char* format, va_list arguments) {
            if (level > AV_LOG_ERROR)
                return;
            std::array<char, 400> text{};
            std::vsnprintf(text.data(), text.size(), format, arguments);
            texts() += text.data();
        });
    }
    ~Complaints() { av_log_set_callback(av_log_default_callback); }
    Complaints(const Complaints&) = delete;
    Complaints& operator=(const Complaints&) = delete;

    static std::string& texts()
    {
        static std::string all;
        return all;
    }
};

class DecodedMovie {
public:
    enum class Edits { Follow, Ignore };
    enum class Look { AtNumbers, AtEverything };

    explicit DecodedMovie(const std::string& path, Edits edits = Edits::Follow)
    {
        AVDictionary* options = nullptr;
        if (edits == Edits::Ignore)
            av_dict_set(&options, "ignore_editlist", "1", 0);
        AVFormatContext* context = nullptr;
        const int error = avformat_open_input(&context, path.c_str(), nullptr, &options);
        av_dict_free(&options);
        if (error < 0)
            return;
        m_context.reset(context);
        avformat_find_stream_info(context, nullptr);
        const AVCodec* codec = nullptr;
        m_stream = av_find_best_stream(context, AVMEDIA_TYPE_VIDEO, -1, -1, &codec, 0);
        if (m_stream < 0)
            return;
        for (unsigned i = 0; i < context->nb_streams; ++i)
            context->streams[i]->discard = int(i) == m_stream ? AVDISCARD_DEFAULT : AVDISCARD_ALL;
        m_decoder.reset(avcodec_alloc_context3(codec));
        avcodec_parameters_to_context(m_decoder.get(), stream().codecpar);
        m_decoder->pkt_timebase = stream().time_base;
        m_decoder->thread_count = 1;
        avcodec_open2(m_decoder.get(), codec, nullptr);
        m_isGood = true;
    }

    bool isGood() const { return m_isGood; }
    AVFormatContext& context() { return *m_context; }
    AVStream& stream() { return *m_context->streams[m_stream]; }
    /// Packets that the decoder refused.
    int refused() const { return m_refused; }
    /// Packets that were decoded and shown, whole.
    int shown() const { return m_shown; }
    /// Those that are left in the file; nothing is decoded.
    int rest()
    {
        int count = 0;
        const auto packet = ffmpeg::newPacket();
        for (; av_read_frame(m_context.get(), packet.get()) >= 0; av_packet_unref(packet.get()))
            count += packet->stream_index == m_stream;
        return count;
    }

    std::vector<DecodedPicture> all(Look look = Look::AtEverything)
    {
        std::vector<DecodedPicture> pictures;
        decode(look, [&](DecodedPicture each) {
            pictures.push_back(std::move(each));
            return true;
        });
        return pictures;
    }

    /// The picture that a player shows after a seek: the last at or before `seconds`.
    int numberAfterSeeking(double seconds)
    {
        const auto tick = std::int64_t(std::llround(seconds / av_q2d(stream().time_base)));
        if (av_seek_frame(m_context.get(), m_stream, tick, AVSEEK_FLAG_BACKWARD) < 0)
            return -1;
        avcodec_flush_buffers(m_decoder.get());
        int number = -1;
        decode(Look::AtNumbers, [&](const DecodedPicture& each) {
            if (each.seconds > seconds + 1e-4)
                return false;
            number = each.number;
            return true;
        });
        return number;
    }

    /// Shows each picture as it was decoded.
    template <typename See> void everyFrame(See see)
    {
        decode([&](const AVFrame& frame) {
            see(frame);
            return true;
        });
    }

private:
    template <typename Take> void decode(Look look, Take take)
    {
        decode([&](const AVFrame& frame) { return take(pictureOf(frame, look)); });
    }

    /// Until `take` says that it is enough.
    template <typename Take> void decode(Take take)
    {
        const auto packet = ffmpeg::newPacket();
        const auto frame = ffmpeg::newFrame();
        for (bool more = true; more;) {
            int error = av_read_frame(m_context.get(), packet.get());
            more = error >= 0;
            if (more && packet->stream_index != m_stream) {
                av_packet_unref(packet.get());
                continue;
            }
            error = avcodec_send_packet(m_decoder.get(), more ? packet.get() : nullptr);
            m_refused += error < 0 && more;
            m_shown += more && !(packet->flags & AV_PKT_FLAG_DISCARD);
            av_packet_unref(packet.get());
            while ((error = avcodec_receive_frame(m_decoder.get(), frame.get())) >= 0) {
                if (!take(*frame))
                    return;
            }
            m_refused += error != AVERROR(EAGAIN) && error != AVERROR_EOF;
        }
    }

    DecodedPicture pictureOf(const AVFrame& frame, Look look)
    {
        DecodedPicture picture;
        picture.seconds = double(frame.best_effort_timestamp) * av_q2d(stream().time_base);
        picture.duration = double(frame.pkt_duration) * av_q2d(stream().time_base);
        picture.number = numberOf(frame);
        if (look == Look::AtNumbers)
            return picture;
        picture.luma.resize(std::size_t(frame.width) * std::size_t(frame.height));
        auto luma = picture.luma.begin();
        for (int y = 0; y < frame.height; ++y, luma += frame.width) {
            if (depthOf(frame) == 8)
                std::copy_n(rowOf(frame, 0, y), frame.width, luma);
            else
                for (int x = 0; x < frame.width; ++x)
                    luma[x] = lumaAt(frame, x, y);
        }
        const AVPixFmtDescriptor& about = *av_pix_fmt_desc_get(AVPixelFormat(frame.format));
        const int bytes = depthOf(frame) > 8 ? 2 : 1;
        picture.hash = 1469598103934665603U;
        for (int plane = 0; plane < 3 && frame.data[plane]; ++plane) {
            const int rows = plane ? AV_CEIL_RSHIFT(frame.height, about.log2_chroma_h) : frame.height;
            const int columns = plane ? AV_CEIL_RSHIFT(frame.width, about.log2_chroma_w) : frame.width;
            for (int y = 0; y < rows; ++y)
                addTo(picture.hash, rowOf(frame, plane, y), std::size_t(columns) * std::size_t(bytes));
        }
        return picture;
    }

    static int depthOf(const AVFrame& frame) { return av_pix_fmt_desc_get(AVPixelFormat(frame.format))->comp[0].depth; }
    static const std::uint8_t* rowOf(const AVFrame& frame, int plane, int y)
    {
        return frame.data[plane] + std::ptrdiff_t(y) * frame.linesize[plane];
    }
    static std::uint8_t lumaAt(const AVFrame& frame, int x, int y)
    {
        const std::uint8_t* row = rowOf(frame, 0, y);
        const int depth = depthOf(frame);
        return depth == 8 ? row[x] : std::uint8_t((row[2 * x] | row[2 * x + 1] << 8) >> (depth - 8));
    }
    static int numberOf(const AVFrame& frame)
    {
        const int perRow = frame.width >= 640 ? 16 : 8;
        int number = 0;
        for (int i = 0; i < 16; ++i)
            number |= (lumaAt(frame, 8 + 38 * (i % perRow) + 16, 8 + 38 * (i / perRow) + 16) > 125) << i;
        return number;
    }
    /// Eight bytes at a time: many pictures are looked at.
    static void addTo(std::uint64_t& hash, const std::uint8_t* bytes, std::size_t count)
    {
        for (std::size_t at = 0; at < count; at += sizeof hash) {
            std::uint64_t part = 0;
            std::memcpy(&part, bytes + at, std::min(sizeof part, count - at));
            hash = (hash ^ part) * 1099511628211U;
            hash ^= hash >> 29;
        }
    }

    ffmpeg::Owned<AVFormatContext> m_context;
    ffmpeg::Owned<AVCodecContext> m_decoder;
    int m_stream = -1;
    int m_refused = 0;
    int m_shown = 0;
    bool m_isGood = false;
};

/// Peak signal to noise ratio of the luma, in dB; 100 for the same.
inline double likeness(const DecodedPicture& a, const DecodedPicture& b)
{
    if (a.luma.size() != b.luma.size() || a.luma.empty())
        return 0;
    double sum = 0;
    for (std::size_t i = 0; i < a.luma.size(); ++i) {
        const double difference = double(a.luma[i]) - b.luma[i];
        sum += difference * difference;
    }
    return sum == 0 ? 100 : 10 * std::log10(255.0 * 255.0 * double(a.luma.size()) / sum);
}

} // namespace tests

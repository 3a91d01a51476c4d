#include "linux/ffmpeg/exporting/video/PictureEncoder.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

namespace {

constexpr int kOneGroup = 1 << 20;

base::ErrorRef failure(int error, const std::string& encoder)
{
    return base::Error::make("ffmpeg", error, "its pictures cannot be encoded (" + encoder + "): " + textOf(error));
}

/// A rate that recordings have; variable ones say anything.
AVRational sensibleRate(AVRational rate)
{
    return rate.num > 0 && rate.den > 0 && av_q2d(rate) >= 1 && av_q2d(rate) <= 480 ? rate : AVRational{0, 1};
}

} // namespace

EncoderRequest EncoderRequest::like(const AVStream& stream, const AVFrame& picture, AVRational timeBase)
{
    EncoderRequest request;
    request.format = static_cast<AVPixelFormat>(picture.format);
    request.width = picture.width;
    request.height = picture.height;
    request.timeBase = timeBase;
    for (const AVRational rate : {AVRational{30, 1}, stream.r_frame_rate, stream.avg_frame_rate})
        request.frameRate = sensibleRate(rate).num ? rate : request.frameRate;
    request.aspect = picture.sample_aspect_ratio;
    request.range = picture.color_range;
    request.primaries = picture.color_primaries;
    request.transfer = picture.color_trc;
    request.matrix = picture.colorspace;
    request.chroma = picture.chroma_location;
    request.isInterlaced = picture.interlaced_frame;
    return request;
}

base::Result<std::unique_ptr<PictureEncoder>> PictureEncoder::open(const EncoderRequest& request)
{
    const AVCodec* codec = avcodec_find_encoder_by_name(request.encoder.c_str());
    if (!codec)
        return failure(AVERROR_ENCODER_NOT_FOUND, request.encoder);
    Owned<AVCodecContext> context(avcodec_alloc_context3(codec));
    context->pix_fmt = request.format;
    context->width = request.width;
    context->height = request.height;
    context->time_base = request.timeBase;
    context->framerate = request.frameRate;
    context->sample_aspect_ratio = request.aspect;
    context->color_range = request.range;
    context->color_primaries = request.primaries;
    context->color_trc = request.transfer;
    context->colorspace = request.matrix;
    context->chroma_sample_location = request.chroma;
    context->profile = request.profile;
    context->gop_size = request.keyframeInterval > 0 ? request.keyframeInterval : kOneGroup;
    context->max_b_frames = 0;
    context->thread_count = request.threads;
    context->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
    if (request.isInterlaced)
        context->flags |= AV_CODEC_FLAG_INTERLACED_DCT | AV_CODEC_FLAG_INTERLACED_ME;
    AVDictionary* options = nullptr;
    for (const auto& [key, value] : request.options)
        av_dict_set(&options, key.c_str(), value.c_str(), 0);
    const int error = avcodec_open2(context.get(), codec, &options);
    av_dict_free(&options);
    if (error < 0)
        return failure(error, request.encoder);
    return std::unique_ptr<PictureEncoder>(new PictureEncoder(std::move(context)));
}

base::Result<void> PictureEncoder::encode(const AVFrame& picture, std::int64_t pts, std::int64_t duration)
{
    m_affinity.assertHere();
    const Owned<AVFrame> frame(av_frame_clone(&picture));
    if (!frame)
        return failure(AVERROR(ENOMEM), m_context->codec->name);
    // What kind of picture it was in its old group says nothing about the new one.
    frame->pict_type = AV_PICTURE_TYPE_NONE;
    frame->key_frame = 0;
    frame->pts = pts;
    frame->pkt_duration = duration;
    m_durations.emplace_back(pts, duration);
    int error = avcodec_send_frame(m_context.get(), frame.get());
    if (error < 0)
        return failure(error, m_context->codec->name);
    return drain();
}

base::Result<void> PictureEncoder::finish()
{
    m_affinity.assertHere();
    const int error = avcodec_send_frame(m_context.get(), nullptr);
    if (error < 0 && error != AVERROR_EOF)
        return failure(error, m_context->codec->name);
    return drain();
}

base::Result<void> PictureEncoder::drain()
{
    for (;;) {
        auto packet = newPacket();
        const int error = avcodec_receive_packet(m_context.get(), packet.get());
        if (error == AVERROR(EAGAIN) || error == AVERROR_EOF)
            return {};
        if (error < 0)
            return failure(error, m_context->codec->name);
        const auto known = std::find_if(m_durations.begin(), m_durations.end(),
                                        [&](const auto& each) { return each.first == packet->pts; });
        if (known != m_durations.end()) {
            packet->duration = known->second;
            m_durations.erase(known);
        }
        m_packets.push_back(std::move(packet));
    }
}

Owned<AVPacket> PictureEncoder::take()
{
    m_affinity.assertHere();
    if (m_packets.empty())
        return nullptr;
    auto packet = std::move(m_packets.front());
    m_packets.pop_front();
    return packet;
}

} // namespace ffmpeg

#include "linux/ffmpeg/exporting/sound/EncodedTrack.h"

namespace ffmpeg {

namespace {

base::Result<void> describeAs(AVStream& output, const SoundEncoder& encoder, int rate)
{
    if (const auto described = encoder.describe(*output.codecpar); !described)
        return described;
    output.codecpar->codec_tag = 0;
    output.time_base = {1, rate};
    return {};
}

} // namespace

TrackLabels TrackLabels::of(const AVStream& stream)
{
    TrackLabels labels;
    const AVDictionaryEntry* entry = nullptr;
    while ((entry = av_dict_get(stream.metadata, "", entry, AV_DICT_IGNORE_SUFFIX)))
        // Who encoded it before, and how much it took, is no longer true.
        if (const std::string key = entry->key; key != "encoder" && key != "ENCODER" && key.rfind("_STATISTICS", 0) != 0
                                                && key != "BPS" && key.rfind("NUMBER_OF_", 0) != 0 && key != "DURATION")
            labels.metadata[key] = entry->value;
    labels.disposition = stream.disposition;
    return labels;
}

void TrackLabels::putOn(AVStream& output) const
{
    for (const auto& [key, value] : metadata)
        av_dict_set(&output.metadata, key.c_str(), value.c_str(), 0);
    output.disposition = disposition;
}

base::Result<void> EncodedTrack::describe(AVStream& output)
{
    assertHere();
    m_labels.putOn(output);
    return describeAs(output, m_encoder->model(), m_encoder->model().rate());
}

base::Result<std::unique_ptr<TrackSource>> LosslessTrack::open(std::unique_ptr<SampleSource> samples, AVCodecID codec,
                                                               int bits, TrackLabels labels)
{
    SoundEncoder::Settings settings;
    settings.codec = codec;
    settings.rate = samples->rate();
    settings.channels = samples->channels();
    settings.bits = bits;
    auto encoder = SoundEncoder::open(settings);
    if (!encoder)
        return encoder.error();
    return std::unique_ptr<TrackSource>(
        new LosslessTrack(std::move(samples), std::move(encoder).value(), std::move(labels)));
}

base::Result<void> LosslessTrack::describe(AVStream& output)
{
    assertHere();
    m_labels.putOn(output);
    return describeAs(output, *m_encoder, m_samples->rate());
}

base::Result<bool> LosslessTrack::next(AVPacket& packet)
{
    assertHere();
    av_packet_unref(&packet);
    // The last packet of FLAC is an empty one that tells a checksum of all.
    while (!m_encoder->receive(packet) || packet.size == 0) {
        if (m_hasEnded)
            return false;
        Planes samples;
        const int got = m_samples->read(samples, m_encoder->frameSize());
        if (got < 0)
            return base::Error::make("ffmpeg", got, "reading the sound failed: " + textOf(got));
        m_hasEnded = got < m_encoder->frameSize();
        int error = 0;
        if (got > 0)
            error = m_encoder->send(samples, 0, got, m_sent);
        if (error >= 0 && m_hasEnded)
            error = m_encoder->finish();
        if (error < 0)
            return base::Error::make("ffmpeg", error, "sound cannot be encoded: " + textOf(error));
        m_sent += got;
    }
    return true;
}

void EncodedTrack::detach()
{
    m_encoder->detach();
    TrackSource::detach();
}

void LosslessTrack::detach()
{
    m_samples->detach();
    m_encoder->detach();
    TrackSource::detach();
}

} // namespace ffmpeg

#include "linux/ffmpeg/exporting/sound/AacJoint.h"

#include "linux/ffmpeg/exporting/sound/SoundDecoder.h"
#include "linux/ffmpeg/exporting/sound/SoundEncoder.h"

#include <algorithm>
#include <cmath>

namespace ffmpeg {

namespace {

constexpr std::ptrdiff_t kRunUp = 8;     ///< frames that the encoder hears before those that count
constexpr std::ptrdiff_t kLookAhead = 2; ///< frames that it wants to hear behind
constexpr std::ptrdiff_t kFarthest = 24; ///< packets encoded at most to find a place where both sides fit
constexpr std::ptrdiff_t kBehind = 3;    ///< copied packets looked at to see whether the joint holds

constexpr double kInaudible = 1e-3; ///< -60 dB of full scale
constexpr double kFaithful = 0.03;  ///< what the encoder may be off by at most, of the sound itself
constexpr double kAtEdge = 0.2;     ///< the same where sound begins or ends at once, which is hard to encode
constexpr double kNoWorse = 2;      ///< than what lies around the joint

bool isFloat(const AVFrame& frame)
{
    return frame.format == AV_SAMPLE_FMT_FLTP;
}

double powerOf(const std::vector<float>& samples)
{
    double sum = 0;
    for (const float sample : samples)
        sum += static_cast<double>(sample) * static_cast<double>(sample);
    return sum / static_cast<double>(samples.size());
}

} // namespace

AacJoints::AacJoints(const AVCodecParameters& parameters)
    : m_parameters(parameters), m_channels(static_cast<std::size_t>(parameters.ch_layout.nb_channels))
{
}

bool AacJoints::decode(const AVCodecParameters& parameters, std::vector<AacPiece>& pieces)
{
    const auto decoder = SoundDecoder::open(parameters, {1, parameters.sample_rate});
    if (!decoder)
        return false;
    const auto channels = static_cast<std::size_t>(parameters.ch_layout.nb_channels);
    for (AacPiece& piece : pieces) {
        piece.sound.assign(channels, std::vector<float>(kAacFrame, 0.0f));
        if (!decoder->send(piece.packet.get()))
            continue;
        while (const AVFrame* frame = decoder->receive()) {
            if (!isFloat(*frame) || frame->nb_samples != kAacFrame || frame->sample_rate != parameters.sample_rate
                || frame->ch_layout.nb_channels != parameters.ch_layout.nb_channels)
                return false;
            for (std::size_t channel = 0; channel < channels; ++channel) {
                const auto* samples = reinterpret_cast<const float*>(frame->extended_data[channel]);
                std::transform(samples, samples + kAacFrame, piece.sound[channel].begin(),
                               [](float sample) { return std::isfinite(sample) ? sample : 0.0f; });
            }
        }
    }
    return true;
}

AacJoints::Frames AacJoints::framesOf(const std::vector<AacPiece>& pieces, std::ptrdiff_t from,
                                      std::ptrdiff_t until) const
{
    const Planes silence(m_channels, std::vector<float>(kAacFrame, 0.0f));
    Frames frames;
    for (std::ptrdiff_t i = from; i < until; ++i) {
        const bool isThere = i >= 0 && i < std::ssize(pieces);
        frames.push_back(isThere ? pieces[static_cast<std::size_t>(i)].sound : silence);
    }
    return frames;
}

std::optional<std::vector<Owned<AVPacket>>> AacJoints::encode(const Frames& frames, std::ptrdiff_t start,
                                                              std::ptrdiff_t from, std::ptrdiff_t until) const
{
    SoundEncoder::Settings settings;
    settings.rate = m_parameters.sample_rate;
    settings.channels = m_parameters.ch_layout.nb_channels;
    settings.bitRate = SoundEncoder::mostBits(settings.rate, settings.channels) * 9 / 10;
    settings.purpose = SoundEncoder::Purpose::Edges;
    auto encoder = SoundEncoder::open(settings);
    if (!encoder || encoder.value()->frameSize() != kAacFrame || encoder.value()->priming() != kAacFrame)
        return std::nullopt;
    std::vector<Owned<AVPacket>> kept;
    auto packet = newPacket();
    const auto keep = [&] {
        while (encoder.value()->receive(*packet)) {
            const std::int64_t index = packet->pts / kAacFrame;
            if (index >= from && index < until) {
                kept.push_back(std::move(packet));
                packet = newPacket();
            }
            av_packet_unref(packet.get());
        }
    };
    // Counted from an index that is never negative, because divisions round towards zero.
    const std::ptrdiff_t shift = from < start ? from : start;
    from -= shift - 1;
    until -= shift - 1;
    for (std::ptrdiff_t i = 0; i < std::ssize(frames); ++i) {
        const std::ptrdiff_t index = start - shift + 1 + i;
        if (encoder.value()->send(frames[static_cast<std::size_t>(i)], 0, kAacFrame, index * kAacFrame) < 0)
            return std::nullopt;
        keep();
    }
    encoder.value()->finish();
    keep();
    if (std::ssize(kept) != until - from)
        return std::nullopt;
    return kept;
}

bool AacJoints::isSeamless(const std::vector<const AVPacket*>& packets, const std::vector<AacPiece>& pieces,
                           std::ptrdiff_t from, std::ptrdiff_t edge, std::ptrdiff_t seam, bool isKnown) const
{
    std::vector<AacPiece> decoded;
    for (const AVPacket* packet : packets)
        decoded.push_back({Owned<AVPacket>(av_packet_clone(packet)), 0, {}});
    if (!decode(m_parameters, decoded))
        return false;
    double atSeam = 0;
    double before = 0;
    double behind = 0;
    double atEdge = 0;
    double loudest = 0;
    const auto isAtEdge = [&](std::ptrdiff_t index) { return std::abs(index - edge) <= 1; };
    for (std::ptrdiff_t i = 0; i < std::ssize(decoded); ++i) {
        const std::ptrdiff_t index = from + i;
        if (index <= from || index < 0 || index >= std::ssize(pieces))
            continue;
        const Planes& wanted = pieces[static_cast<std::size_t>(index)].sound;
        Planes& got = decoded[static_cast<std::size_t>(i)].sound;
        for (std::size_t channel = 0; channel < m_channels; ++channel) {
            loudest = std::max(loudest, powerOf(wanted[channel]));
            for (std::size_t n = 0; n < got[channel].size(); ++n)
                got[channel][n] -= wanted[channel][n];
            double& worst = index == seam ? atSeam : isAtEdge(index) ? atEdge : index < seam ? before : behind;
            worst = std::max(worst, powerOf(got[channel]));
        }
    }
    const double off = std::sqrt(atSeam);
    const double ours = std::sqrt(edge < seam ? before : behind);
    const double theirs = std::sqrt(edge < seam ? behind : before);
    if (ours > std::max(kInaudible, kFaithful * std::sqrt(loudest))
        || std::sqrt(atEdge) > std::max(kInaudible, kAtEdge * std::sqrt(loudest)))
        return false;
    // Some encoders leave noise to the decoder, who makes other noise each time. Where we know that the windows fit,
    // that is no seam.
    return off <= std::max(kInaudible, kNoWorse * (isKnown ? std::max(ours, theirs) : ours));
}

std::optional<AacJoint> AacJoints::atStart(const std::vector<AacPiece>& pieces, std::size_t first) const
{
    m_affinity.assertHere();
    const auto begin = static_cast<std::ptrdiff_t>(first) - 1;
    const std::ptrdiff_t end = std::min(begin + kFarthest, std::ssize(pieces) - kBehind - 1);
    const std::ptrdiff_t start = begin - kRunUp;
    Frames frames = framesOf(pieces, start, end + kLookAhead);
    const auto made = encode(frames, start, begin, end);
    if (!made)
        return std::nullopt;
    const int channels = static_cast<int>(m_channels);
    // The joint is in the frame behind packet `last`: its second half and the first half of the copied one add up there.
    for (std::ptrdiff_t last = begin + 1; last < end; ++last) {
        const AVPacket& copied = *pieces[static_cast<std::size_t>(last + 1)].packet;
        const auto replaced = aacWindowsOf(*pieces[static_cast<std::size_t>(last)].packet, channels);
        const auto theirs = aacWindowsOf(copied, channels);
        const auto ours = aacWindowsOf(*(*made)[static_cast<std::size_t>(last - begin)], channels);
        if (!replaced || !theirs || !ours || !ours->endsLong() || !theirs->beginsLong())
            continue;
        const bool isKnown = replaced->isOfAll && theirs->isOfAll && ours->isOfAll;
        const bool fits = ours->shape == replaced->shape;
        if (!fits && !isKnown)
            continue;
        auto encoded = std::optional<std::vector<Owned<AVPacket>>>(std::in_place);
        if (fits) {
            for (std::ptrdiff_t i = begin; i <= last; ++i)
                encoded->emplace_back(av_packet_clone((*made)[static_cast<std::size_t>(i - begin)].get()));
        } else {
            Frames bent(frames.begin(), frames.begin() + (last + 1 - start + kLookAhead));
            for (auto& plane : bent[static_cast<std::size_t>(last + 1 - start)])
                bendForFallingHalf(plane, ours->shape, replaced->shape);
            encoded = encode(bent, start, begin, last + 1);
            const auto again = encoded ? aacWindowsOf(*encoded->back(), channels) : std::nullopt;
            if (!again || !again->isOfAll || !again->endsLong() || again->shape != ours->shape
                || av_packet_make_writable(encoded->back().get()) < 0)
                continue;
            setAacShape(*encoded->back(), *again, replaced->shape);
        }
        std::vector<const AVPacket*> joined;
        for (const auto& packet : *encoded)
            joined.push_back(packet.get());
        for (std::ptrdiff_t i = last + 1; i <= last + kBehind; ++i)
            joined.push_back(pieces[static_cast<std::size_t>(i)].packet.get());
        if (isSeamless(joined, pieces, begin, begin + 1, last + 1, isKnown))
            return AacJoint{std::move(*encoded), static_cast<std::size_t>(last + 1)};
    }
    return std::nullopt;
}

std::optional<AacJoint> AacJoints::atEnd(const std::vector<AacPiece>& pieces, std::size_t last) const
{
    m_affinity.assertHere();
    const auto end = static_cast<std::ptrdiff_t>(last);
    const std::ptrdiff_t nearest = std::max<std::ptrdiff_t>(kBehind, end - kFarthest);
    const int channels = static_cast<int>(m_channels);
    // A packet reaches over two frames, and the last copied one must not reach over the edge.
    for (std::ptrdiff_t copied = end - 2; copied >= nearest; --copied) {
        const auto theirs = aacWindowsOf(*pieces[static_cast<std::size_t>(copied)].packet, channels);
        if (!theirs || !theirs->endsLong())
            continue;
        const std::ptrdiff_t start = copied - kRunUp;
        Frames frames = framesOf(pieces, start, end + 1 + kLookAhead);
        auto encoded = encode(frames, start, copied, end + 1);
        if (!encoded)
            return std::nullopt;
        // Of the packet that is left out for the copied one, only the shape counts: it is that of the next one's first
        // half.
        auto left = aacWindowsOf(*(*encoded)[0], channels);
        auto ours = aacWindowsOf(*(*encoded)[1], channels);
        if (!left || !ours || !ours->beginsLong())
            continue;
        const bool isKnown = theirs->isOfAll && left->isOfAll && ours->isOfAll;
        if (left->shape != theirs->shape) {
            if (!isKnown)
                continue;
            const int shape = left->shape;
            for (auto& plane : frames[static_cast<std::size_t>(copied + 1 - start)])
                bendForRisingHalf(plane, shape, theirs->shape);
            encoded = encode(frames, start, copied, end + 1);
            left = encoded ? aacWindowsOf(*(*encoded)[0], channels) : std::nullopt;
            ours = encoded ? aacWindowsOf(*(*encoded)[1], channels) : std::nullopt;
            if (!left || !ours || !ours->isOfAll || !ours->beginsLong() || left->shape != shape)
                continue;
        }
        encoded->erase(encoded->begin());
        std::vector<const AVPacket*> joined;
        for (std::ptrdiff_t i = copied - kBehind; i <= copied; ++i)
            joined.push_back(pieces[static_cast<std::size_t>(i)].packet.get());
        for (const auto& packet : *encoded)
            joined.push_back(packet.get());
        if (isSeamless(joined, pieces, copied - kBehind, end, copied + 1, isKnown))
            return AacJoint{std::move(*encoded), static_cast<std::size_t>(copied)};
    }
    return std::nullopt;
}

} // namespace ffmpeg

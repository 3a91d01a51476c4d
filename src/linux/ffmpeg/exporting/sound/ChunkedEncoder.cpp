#include "linux/ffmpeg/exporting/sound/ChunkedEncoder.h"

#include "linux/ffmpeg/exporting/sound/AacFrame.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

namespace {

/// Frames that a chunk's encoder hears first. With 32 its state still differed now and then, up to -17 dB of full scale.
constexpr std::int64_t kWarmUp = 64;
/// Frames that it hears behind the chunk: it looks ahead.
constexpr std::int64_t kRunOut = 4;

constexpr std::int64_t kLongestSeconds = 60;
constexpr std::int64_t kShortestSeconds = 10; ///< below, most of the work would be warming up
constexpr int kReadAtOnce = 1 << 16;

} // namespace

ChunkedEncoder::Plan ChunkedEncoder::plan(std::int64_t samples, int rate, unsigned cores, std::size_t tracks)
{
    const auto workers = static_cast<std::int64_t>(std::max(cores, 1u));
    const std::int64_t longest =
        std::max(kLongestSeconds / static_cast<std::int64_t>(std::max<std::size_t>(tracks, 1)), kShortestSeconds) * rate
        / kAacFrame;
    const std::int64_t frames = samples / kAacFrame + 2;
    const std::int64_t rounds = (frames + longest * workers - 1) / (longest * workers);
    const std::int64_t even = (frames + rounds * workers - 1) / (rounds * workers);
    return {std::max(even, kShortestSeconds * rate / kAacFrame), static_cast<unsigned>(workers)};
}

ChunkedEncoder::ChunkedEncoder(std::unique_ptr<SampleSource> source, std::unique_ptr<SoundEncoder> model,
                               SoundEncoder::Settings settings, Plan plan, Cancelled cancelled)
    : m_source(std::move(source)), m_model(std::move(model)), m_settings(settings), m_plan(plan),
      m_cancelled(std::move(cancelled)), m_samples(static_cast<std::size_t>(settings.channels))
{
}

base::Result<std::unique_ptr<ChunkedEncoder>> ChunkedEncoder::open(std::unique_ptr<SampleSource> source,
                                                                   std::int64_t bitRate, Plan plan, Cancelled cancelled)
{
    SoundEncoder::Settings settings;
    settings.rate = source->rate();
    settings.channels = source->channels();
    settings.bitRate = bitRate;
    auto model = SoundEncoder::open(settings);
    if (!model)
        return model.error();
    return std::unique_ptr<ChunkedEncoder>(
        new ChunkedEncoder(std::move(source), std::move(model).value(), settings, plan, std::move(cancelled)));
}

ChunkedEncoder::~ChunkedEncoder()
{
    *m_isGone = true; // whoever still encodes stops soon; the futures wait for them
}

base::Result<void> ChunkedEncoder::startOne()
{
    const std::int64_t from = m_begun * m_plan.framesInChunk;
    const std::int64_t until = from + m_plan.framesInChunk;
    const std::int64_t start = std::max<std::int64_t>(0, from - kWarmUp);
    const auto wanted = static_cast<std::size_t>((until + kRunOut - m_samplesStart) * kAacFrame);
    while (!m_hasEnded && m_samples.front().size() < wanted) {
        const auto missing = static_cast<int>(std::min<std::size_t>(wanted - m_samples.front().size(), kReadAtOnce));
        const int got = m_source->read(m_samples, missing);
        if (got < 0)
            return base::Error::make("ffmpeg", got, "reading the sound failed: " + textOf(got));
        m_hasEnded = got < missing;
    }
    Chunk chunk{start, from, until, m_hasEnded, {}};
    const std::int64_t next = std::max<std::int64_t>(0, until - kWarmUp);
    const auto skipped = static_cast<std::ptrdiff_t>((start - m_samplesStart) * kAacFrame);
    for (auto& plane : m_samples) {
        chunk.samples.emplace_back(plane.begin() + skipped, plane.end());
        const auto done = static_cast<std::ptrdiff_t>((next - m_samplesStart) * kAacFrame);
        plane.erase(plane.begin(), plane.begin() + std::min(done, std::ssize(plane)));
    }
    m_samplesStart = next;
    ++m_begun;
    m_running.push_back(std::async(std::launch::async, [settings = m_settings, chunk = std::move(chunk),
                                                        cancelled = m_cancelled, gone = m_isGone] {
        return encode(settings, chunk, [&] { return *gone || (cancelled && *cancelled); });
    }));
    return {};
}

base::Result<ChunkedEncoder::Packets> ChunkedEncoder::encode(const SoundEncoder::Settings& settings, const Chunk& chunk,
                                                             const std::function<bool()>& isUnwanted)
{
    auto encoder = SoundEncoder::open(settings);
    if (!encoder)
        return encoder.error();
    Packets packets;
    auto packet = newPacket();
    const auto keep = [&] {
        while (encoder.value()->receive(*packet)) {
            const std::int64_t index = packet->pts / kAacFrame + 1;
            if (index >= chunk.from && (chunk.isLast || index < chunk.until)) {
                packets.push_back(std::move(packet));
                packet = newPacket();
            }
            av_packet_unref(packet.get());
        }
    };
    const std::size_t count = chunk.samples.front().size();
    for (std::size_t from = 0; from < count; from += kAacFrame) {
        if (isUnwanted())
            return base::Error::make("ffmpeg", AVERROR_EXIT, "encoding was cancelled");
        const int length = static_cast<int>(std::min<std::size_t>(kAacFrame, count - from));
        const std::int64_t pts = chunk.start * kAacFrame + static_cast<std::int64_t>(from);
        if (const int error = encoder.value()->send(chunk.samples, from, length, pts); error < 0)
            return base::Error::make("ffmpeg", error, "sound cannot be encoded: " + textOf(error));
        keep();
    }
    if (chunk.isLast) {
        encoder.value()->finish();
        keep();
    }
    return packets;
}

base::Result<bool> ChunkedEncoder::next(AVPacket& packet)
{
    m_affinity.assertHere();
    while (m_ready.empty()) {
        if (m_cancelled && *m_cancelled)
            return base::Error::make("ffmpeg", AVERROR_EXIT, "encoding was cancelled");
        // One more than there are cores, so that none waits while this thread does something else.
        while (!m_hasEnded && m_running.size() <= m_plan.workers)
            if (const auto started = startOne(); !started)
                return started.error();
        if (m_running.empty())
            return false;
        auto packets = m_running.front().get();
        m_running.pop_front();
        if (!packets)
            return packets.error();
        for (auto& each : packets.value())
            m_ready.push_back(std::move(each));
        if (!m_hasEnded)
            if (const auto started = startOne(); !started)
                return started.error();
    }
    av_packet_unref(&packet);
    av_packet_move_ref(&packet, m_ready.front().get());
    m_ready.pop_front();
    return true;
}

void ChunkedEncoder::detach()
{
    m_source->detach();
    m_model->detach();
    m_affinity.detach();
}

} // namespace ffmpeg

#include "linux/ffmpeg/exporting/sound/AacFrame.h"

#include <cmath>
#include <numbers>

namespace ffmpeg {

namespace {

/// Kinds of elements in a packet (ISO/IEC 14496-3, 4.5.2.1).
enum Element : unsigned { kSingle = 0, kPair = 1, kLowFrequency = 3, kData = 4, kFill = 6 };

constexpr unsigned kAacLc = 2;
constexpr unsigned kExplicitRate = 15;
constexpr unsigned kSbrSync = 0x2b7;
constexpr double kKaiserAlpha = 4; ///< of long windows, as the standard sets it

class Bits {
public:
    Bits(const std::uint8_t* data, std::size_t size) : m_data(data), m_end(size * 8) {}

    std::size_t position() const { return m_position; }
    bool isOver() const { return m_position > m_end; }
    std::size_t left() const { return isOver() ? 0 : m_end - m_position; }
    void skip(std::size_t bits) { m_position += bits; }
    void align() { m_position = (m_position + 7) / 8 * 8; }
    unsigned take(int bits)
    {
        unsigned value = 0;
        for (; bits > 0; --bits, ++m_position) {
            const bool isSet = m_position < m_end && (m_data[m_position / 8] >> (7 - m_position % 8) & 1);
            value = value << 1 | (isSet ? 1u : 0u);
        }
        return value;
    }

private:
    const std::uint8_t* m_data;
    std::size_t m_end;
    std::size_t m_position = 0;
};

void skipData(Bits& bits)
{
    bits.skip(4);
    const bool aligns = bits.take(1) != 0;
    unsigned count = bits.take(8);
    if (count == 255)
        count += bits.take(8);
    if (aligns)
        bits.align();
    bits.skip(std::size_t{count} * 8);
}

void skipFill(Bits& bits)
{
    unsigned count = bits.take(4);
    if (count == 15)
        count += bits.take(8) - 1;
    bits.skip(std::size_t{count} * 8);
}

std::array<float, kAacFrame> sine()
{
    std::array<float, kAacFrame> window{};
    for (std::size_t n = 0; n < window.size(); ++n)
        window[n] = static_cast<float>(std::sin(std::numbers::pi / (2 * kAacFrame) * (static_cast<double>(n) + 0.5)));
    return window;
}

std::array<float, kAacFrame> kaiserBesselDerived()
{
    std::array<double, kAacFrame + 1> kernel{};
    double sum = 0;
    for (std::size_t n = 0; n < kernel.size(); ++n) {
        const double x = 2 * static_cast<double>(n) / kAacFrame - 1;
        kernel[n] = std::cyl_bessel_i(0, std::numbers::pi * kKaiserAlpha * std::sqrt(1 - x * x));
        sum += kernel[n];
    }
    std::array<float, kAacFrame> window{};
    double running = 0;
    for (std::size_t n = 0; n < window.size(); ++n) {
        running += kernel[n];
        window[n] = static_cast<float>(std::sqrt(running / sum));
    }
    return window;
}

} // namespace

std::optional<AacWindows> aacWindowsOf(const AVPacket& packet, int channels)
{
    if (!packet.data || packet.size <= 0)
        return std::nullopt;
    Bits bits(packet.data, static_cast<std::size_t>(packet.size));
    while (bits.left() > 16) {
        const unsigned element = bits.take(3);
        if (element == kData) {
            skipData(bits);
            continue;
        }
        if (element == kFill) {
            skipFill(bits);
            continue;
        }
        if (element != kSingle && element != kPair)
            return std::nullopt;
        bits.skip(4);
        bool isOfAll = channels == 1;
        const bool isCommon = element == kPair && bits.take(1) != 0;
        if (isCommon)
            isOfAll = channels == 2;
        else
            bits.skip(8); // the gain
        bits.skip(1);
        const auto sequence = static_cast<AacWindows::Sequence>(bits.take(2));
        const std::size_t at = bits.position();
        const auto shape = static_cast<int>(bits.take(1));
        if (bits.isOver())
            return std::nullopt;
        return AacWindows{sequence, shape, at, isOfAll};
    }
    return std::nullopt;
}

void setAacShape(AVPacket& packet, const AacWindows& windows, int shape)
{
    const auto mask = static_cast<std::uint8_t>(0x80 >> windows.shapeBit % 8);
    std::uint8_t& byte = packet.data[windows.shapeBit / 8];
    byte = static_cast<std::uint8_t>(shape ? byte | mask : byte & ~mask);
}

bool isPlainAac(const AVCodecParameters& parameters)
{
    if (parameters.codec_id != AV_CODEC_ID_AAC || !parameters.extradata || parameters.extradata_size < 2)
        return false;
    Bits bits(parameters.extradata, static_cast<std::size_t>(parameters.extradata_size));
    if (bits.take(5) != kAacLc)
        return false;
    if (bits.take(4) == kExplicitRate)
        return false;
    const unsigned layout = bits.take(4);
    const unsigned channels = layout == 7 ? 8 : layout;
    if (layout == 0 || layout > 7 || static_cast<int>(channels) != parameters.ch_layout.nb_channels)
        return false;
    if (bits.take(3) != 0) // other frame length, dependent core, extension
        return false;
    // Behind it an extension may announce that half of the sound's band is described otherwise.
    return bits.left() < 17 || bits.take(11) != kSbrSync || bits.take(5) != 5 || bits.take(1) == 0;
}

const std::array<float, kAacFrame>& aacWindow(int shape)
{
    static const std::array<float, kAacFrame> windows[] = {sine(), kaiserBesselDerived()};
    return windows[shape ? 1 : 0];
}

void bendForRisingHalf(std::span<float> frame, int made, int wanted)
{
    const auto& has = aacWindow(made);
    const auto& wants = aacWindow(wanted);
    for (std::size_t n = 0, m = frame.size() - 1; n < m; ++n, --m) {
        // The first half of a window is folded with a change of sign.
        const float off = (wants[n] - has[n]) * frame[n] - (wants[m] - has[m]) * frame[m];
        frame[n] += has[n] * off;
        frame[m] -= has[m] * off;
    }
}

void bendForFallingHalf(std::span<float> frame, int made, int wanted)
{
    const auto& has = aacWindow(made);
    const auto& wants = aacWindow(wanted);
    for (std::size_t n = 0, m = frame.size() - 1; n < m; ++n, --m) {
        // The falling half is the rising one backwards, and its folding keeps the sign.
        const float off = (wants[m] - has[m]) * frame[n] + (wants[n] - has[n]) * frame[m];
        frame[n] += has[m] * off;
        frame[m] += has[n] * off;
    }
}

} // namespace ffmpeg

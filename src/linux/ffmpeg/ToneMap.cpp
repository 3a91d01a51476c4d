#include "linux/ffmpeg/ToneMap.h"

#include "linux/ffmpeg/bitstream/HdrMetadata.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace ffmpeg {

namespace {

constexpr double kPageWhite = 203;  ///< candelas a square metre, of a page that is not meant to dazzle: ITU-R BT.2408
constexpr double kUsualPeak = 1000; ///< what movies are mastered for that do not say it, and what HLG is defined at
constexpr double kHighestPeak = 10000; ///< what PQ can say

constexpr std::size_t kCodes = 1024;  ///< of 10 bits
constexpr std::size_t kShades = 8192; ///< of light that becomes 256 shades: enough for the darkest of them

using LightOfCode = std::array<float, kCodes>;

/// SMPTE ST 2084, in page whites.
LightOfCode lightOfPq()
{
    constexpr double m1 = 2610.0 / 16384, m2 = 2523.0 / 4096 * 128;
    constexpr double c1 = 3424.0 / 4096, c2 = 2413.0 / 4096 * 32, c3 = 2392.0 / 4096 * 32;
    LightOfCode light;
    for (std::size_t i = 0; i < kCodes; ++i) {
        const double power = std::pow(double(i) / (kCodes - 1), 1 / m2);
        light[i] = float(kHighestPeak / kPageWhite * std::pow(std::max(power - c1, 0.0) / (c2 - c3 * power), 1 / m1));
    }
    return light;
}

/// ARIB STD-B67, of the scene, from 0 to 1.
LightOfCode lightOfHlg()
{
    constexpr double a = 0.17883277, b = 0.28466892, c = 0.55991073;
    LightOfCode light;
    for (std::size_t i = 0; i < kCodes; ++i) {
        const double code = double(i) / (kCodes - 1);
        light[i] = float(code <= 0.5 ? code * code / 3 : (std::exp((code - c) / a) + b) / 12);
    }
    return light;
}

/// How much brighter a screen of the usual peak shows what has this luminance in a scene, in page whites.
std::array<float, kShades> gainOfHlg()
{
    constexpr double kSystemGamma = 1.2;
    std::array<float, kShades> gain;
    for (std::size_t i = 0; i < kShades; ++i)
        gain[i] = float(kUsualPeak / kPageWhite * std::pow(double(i) / (kShades - 1), kSystemGamma - 1));
    return gain;
}

/// sRGB.
std::array<std::uint8_t, kShades> codesOfShades()
{
    std::array<std::uint8_t, kShades> codes;
    for (std::size_t i = 0; i < kShades; ++i) {
        const double light = double(i) / (kShades - 1);
        const double code = light <= 0.0031308 ? light * 12.92 : 1.055 * std::pow(light, 1 / 2.4) - 0.055;
        codes[i] = std::uint8_t(std::lround(code * 255));
    }
    return codes;
}

std::size_t shadeOf(float light)
{
    // By way of a signed number, which processors make of a fraction at once.
    return static_cast<std::size_t>(static_cast<int>(std::clamp(light, 0.0F, 1.0F) * (kShades - 0.5F)));
}

/// Darker than half of a page's white stays as it is; what is brighter comes together, up to the peak, which becomes the
/// screen's white. The curve has no corner.
struct Shoulder {
    static constexpr float kBegin = 0.5F;
    float a = 0, b = 0, scale = 1;

    explicit Shoulder(float peak)
    {
        constexpr float j = kBegin;
        a = -j * j * (peak - 1) / (j * j - 2 * j + peak);
        b = (j * j - 2 * j * peak + peak) / (peak - 1);
        scale = (b * b + 2 * b * j + j * j) / (b - a);
    }
    /// What light is multiplied by whose strongest colour is `light`.
    float gain(float light) const
    {
        const float bright = std::max(light, kBegin);
        return light <= kBegin ? 1 : scale * (bright + a) / ((bright + b) * bright);
    }
};

double peakOf(const AVFrame& picture)
{
    const auto find = [&](AVFrameSideDataType type) {
        const AVFrameSideData* data = av_frame_get_side_data(&picture, type);
        return data ? data->data : nullptr;
    };
    if (const auto* data = find(AV_FRAME_DATA_CONTENT_LIGHT_LEVEL))
        if (const unsigned most = reinterpret_cast<const AVContentLightMetadata*>(data)->MaxCLL; most > 0)
            return most;
    if (const auto* data = find(AV_FRAME_DATA_MASTERING_DISPLAY_METADATA)) {
        const auto& display = *reinterpret_cast<const AVMasteringDisplayMetadata*>(data);
        if (display.has_luminance && display.max_luminance.num > 0 && display.max_luminance.den > 0)
            return av_q2d(display.max_luminance);
    }
    return kUsualPeak;
}

} // namespace

bool ToneMap::isNeededFor(const AVFrame& picture)
{
    return isHdr(picture.color_trc);
}

ToneMap ToneMap::of(const AVFrame& picture)
{
    const bool isPq = picture.color_trc == AVCOL_TRC_SMPTE2084;
    const double peak = isPq ? std::clamp(peakOf(picture), kPageWhite * 1.01, kHighestPeak) : kUsualPeak;
    const bool isWide = picture.color_primaries == AVCOL_PRI_BT2020 || picture.color_primaries == AVCOL_PRI_UNSPECIFIED;
    return {picture.color_trc, isWide, float(peak / kPageWhite)};
}

void ToneMap::apply(const Row& row, std::uint8_t* bgra, int width) const
{
    static const LightOfCode pq = lightOfPq();
    static const LightOfCode hlg = lightOfHlg();
    static const auto hlgGain = gainOfHlg();
    static const auto codes = codesOfShades();
    const bool isPq = transfer == AVCOL_TRC_SMPTE2084;
    const LightOfCode& light = isPq ? pq : hlg;
    const Shoulder shoulder(peak);
    for (int x = 0; x < width; ++x, bgra += 4) {
        float r = light[row.red[x] & (kCodes - 1)];
        float g = light[row.green[x] & (kCodes - 1)];
        float b = light[row.blue[x] & (kCodes - 1)];
        if (!isPq) {
            const float gain = hlgGain[shadeOf(0.2627F * r + 0.6780F * g + 0.0593F * b)];
            r *= gain;
            g *= gain;
            b *= gain;
        }
        if (isWide) { // ITU-R BT.2087
            const float red = 1.6605F * r - 0.5876F * g - 0.0728F * b;
            const float green = -0.1246F * r + 1.1329F * g - 0.0083F * b;
            b = -0.0182F * r - 0.1006F * g + 1.1187F * b;
            r = red;
            g = green;
        }
        const float gain = shoulder.gain(std::max(std::max(r, g), b));
        bgra[0] = codes[shadeOf(b * gain)];
        bgra[1] = codes[shadeOf(g * gain)];
        bgra[2] = codes[shadeOf(r * gain)];
        bgra[3] = 255;
    }
}

} // namespace ffmpeg

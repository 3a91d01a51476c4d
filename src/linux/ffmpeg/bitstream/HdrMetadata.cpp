#include "linux/ffmpeg/bitstream/HdrMetadata.h"

#include <cmath>
#include <cstddef>

namespace ffmpeg {

namespace {

/// Big-endian, as both codecs have it.
void put(Bytes& bytes, AVRational value, double unit, int count)
{
    const auto rounded = static_cast<std::uint32_t>(std::llround(value.den ? av_q2d(value) * unit : 0));
    for (int shift = 8 * (count - 1); shift >= 0; shift -= 8)
        bytes.push_back(static_cast<std::uint8_t>(rounded >> shift));
}

void put(Bytes& bytes, const AVContentLightMetadata& light)
{
    for (const unsigned value : {light.MaxCLL, light.MaxFALL})
        put(bytes, {static_cast<int>(value), 1}, 1, 2);
}

} // namespace

HdrMetadata HdrMetadata::of(const AVStream& stream, const AVFrame& picture)
{
    const auto find = [&](AVFrameSideDataType inPicture, AVPacketSideDataType inStream) -> const std::uint8_t* {
        if (const AVFrameSideData* data = av_frame_get_side_data(&picture, inPicture))
            return data->data;
        return av_stream_get_side_data(&stream, inStream, nullptr);
    };
    HdrMetadata found;
    if (const auto* data = find(AV_FRAME_DATA_MASTERING_DISPLAY_METADATA, AV_PKT_DATA_MASTERING_DISPLAY_METADATA)) {
        const auto& display = *reinterpret_cast<const AVMasteringDisplayMetadata*>(data);
        if (display.has_primaries && display.has_luminance)
            found.display = display;
    }
    if (const auto* data = find(AV_FRAME_DATA_CONTENT_LIGHT_LEVEL, AV_PKT_DATA_CONTENT_LIGHT_LEVEL))
        found.light = *reinterpret_cast<const AVContentLightMetadata*>(data);
    return found;
}

Bytes HdrMetadata::hevcUnit() const
{
    constexpr std::uint8_t kPrefixSei = 39 << 1;
    Bytes unit{kPrefixSei, 1};
    if (display) {
        constexpr double kChromaticities = 50000; // a unit is 0.00002
        constexpr double kLuminances = 10000;     // candelas a square metre; a unit is 0.0001
        unit.insert(unit.end(), {137, 24});
        for (const int primary : {1, 2, 0}) // green, blue, red
            for (const AVRational each : display->display_primaries[primary])
                put(unit, each, kChromaticities, 2);
        for (const AVRational each : display->white_point)
            put(unit, each, kChromaticities, 2);
        put(unit, display->max_luminance, kLuminances, 4);
        put(unit, display->min_luminance, kLuminances, 4);
    }
    if (light) {
        unit.insert(unit.end(), {144, 4});
        put(unit, *light);
    }
    unit.push_back(0x80);
    return withEmulation(unit);
}

Bytes HdrMetadata::av1Units() const
{
    constexpr std::uint8_t kMetadataWithSize = 5 << 3 | 2;
    Bytes units;
    const auto begin = [&](std::uint8_t size, std::uint8_t kind) {
        for (const std::uint8_t each : {kMetadataWithSize, size, kind})
            units.push_back(each);
    };
    if (light) {
        begin(1 + 4 + 1, 1);
        put(units, *light);
        units.push_back(0x80);
    }
    if (display) {
        constexpr double kChromaticities = 1 << 16;
        begin(1 + 24 + 1, 2);
        for (const auto& primary : display->display_primaries)
            for (const AVRational each : primary)
                put(units, each, kChromaticities, 2);
        for (const AVRational each : display->white_point)
            put(units, each, kChromaticities, 2);
        put(units, display->max_luminance, 1 << 8, 4);
        put(units, display->min_luminance, 1 << 14, 4);
        units.push_back(0x80);
    }
    return units;
}

base::Result<void> HdrMetadata::describe(AVStream& output) const
{
    const auto add = [&](AVPacketSideDataType type, const auto& value) {
        if (av_stream_get_side_data(&output, type, nullptr))
            return true;
        auto* data = av_stream_new_side_data(&output, type, sizeof value);
        if (data)
            *reinterpret_cast<std::remove_cvref_t<decltype(value)>*>(data) = value;
        return data != nullptr;
    };
    if ((display && !add(AV_PKT_DATA_MASTERING_DISPLAY_METADATA, *display))
        || (light && !add(AV_PKT_DATA_CONTENT_LIGHT_LEVEL, *light)))
        return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
    return {};
}

} // namespace ffmpeg

#include "linux/ffmpeg/bitstream/NalUnits.h"

#include <algorithm>
#include <array>

namespace ffmpeg {

std::vector<ByteView> unitsBetweenStartCodes(ByteView data)
{
    std::vector<ByteView> units;
    std::optional<std::size_t> begin;
    const auto end = [&](std::size_t at) {
        if (!begin)
            return;
        const ByteView unit = withoutTrailingZeros(data.subspan(*begin, at - *begin));
        if (!unit.empty())
            units.push_back(unit);
    };
    for (std::size_t at = 0; at + 3 <= data.size(); ++at) {
        if (data[at] == 0 && data[at + 1] == 0 && data[at + 2] == 1) {
            end(at);
            begin = at + 3;
            at += 2;
        }
    }
    end(data.size());
    return units;
}

std::optional<std::vector<ByteView>> unitsBehindLengths(ByteView data, int lengthSize)
{
    std::vector<ByteView> units;
    const auto header = static_cast<std::size_t>(lengthSize);
    std::size_t at = 0;
    while (at + header <= data.size()) {
        std::size_t length = 0;
        for (std::size_t i = 0; i < header; ++i)
            length = length << 8 | data[at + i];
        at += header;
        if (length > data.size() - at)
            return std::nullopt;
        const ByteView unit = withoutTrailingZeros(data.subspan(at, length));
        if (!unit.empty())
            units.push_back(unit);
        at += length;
    }
    return units;
}

bool replacePayload(AVPacket& packet, const std::vector<ByteView>& units, int lengthSize)
{
    constexpr std::array<std::uint8_t, 4> kStartCode{0, 0, 0, 1};
    const std::size_t header = lengthSize > 0 ? static_cast<std::size_t>(lengthSize) : kStartCode.size();
    std::size_t size = 0;
    for (const ByteView unit : units) {
        if (lengthSize > 0 && lengthSize < 4 && unit.size() >> (8 * lengthSize) != 0)
            return false;
        size += header + unit.size();
    }
    AVBufferRef* buffer = av_buffer_alloc(size + AV_INPUT_BUFFER_PADDING_SIZE);
    if (!buffer)
        return false;
    std::uint8_t* to = buffer->data;
    for (const ByteView unit : units) {
        if (lengthSize == 0)
            to = std::copy(kStartCode.begin(), kStartCode.end(), to);
        for (int i = lengthSize - 1; i >= 0; --i)
            *to++ = static_cast<std::uint8_t>(unit.size() >> (8 * i));
        to = std::copy(unit.begin(), unit.end(), to);
    }
    std::fill_n(to, AV_INPUT_BUFFER_PADDING_SIZE, std::uint8_t{0});
    av_buffer_unref(&packet.buf); // only now: the units may lie in it
    packet.buf = buffer;
    packet.data = buffer->data;
    packet.size = static_cast<int>(size);
    return true;
}

std::optional<std::vector<ByteView>> unitsOfHeader(ByteView header, std::size_t& at, int count)
{
    constexpr std::size_t kLength = 2;
    std::vector<ByteView> units;
    for (; count > 0; --count) {
        if (at + kLength > header.size())
            return std::nullopt;
        const std::size_t size = static_cast<std::size_t>(header[at]) << 8 | header[at + 1];
        at += kLength;
        if (size > header.size() - at)
            return std::nullopt;
        units.push_back(header.subspan(at, size));
        at += size;
    }
    return units;
}

std::vector<SeiMessage> seiMessagesIn(ByteView bytes)
{
    std::vector<SeiMessage> messages;
    const auto number = [&] { // of bytes that are added up as long as they are full
        std::uint32_t sum = 0;
        std::uint8_t byte = 0xFF;
        while (byte == 0xFF && !bytes.empty()) {
            byte = bytes.front();
            sum += byte;
            bytes = bytes.subspan(1);
        }
        return sum;
    };
    while (bytes.size() > 2) { // the unit's end takes one
        const std::uint32_t type = number();
        const std::uint32_t size = number();
        if (size > bytes.size())
            break;
        messages.push_back({type, bytes.first(size)});
        bytes = bytes.subspan(size);
    }
    return messages;
}

bool setExtradata(AVCodecParameters& parameters, ByteView bytes)
{
    av_freep(&parameters.extradata);
    parameters.extradata_size = 0;
    parameters.extradata = static_cast<std::uint8_t*>(av_mallocz(bytes.size() + AV_INPUT_BUFFER_PADDING_SIZE));
    if (!parameters.extradata)
        return false;
    std::copy(bytes.begin(), bytes.end(), parameters.extradata);
    parameters.extradata_size = static_cast<int>(bytes.size());
    return true;
}

} // namespace ffmpeg

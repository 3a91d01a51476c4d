#include "linux/ffmpeg/bitstream/Bits.h"

#include <bit>

namespace ffmpeg {

Bytes withoutEmulation(ByteView nal)
{
    Bytes payload;
    payload.reserve(nal.size());
    int zeros = 0;
    for (const std::uint8_t byte : nal) {
        if (zeros >= 2 && byte == 3) {
            zeros = 0;
            continue;
        }
        zeros = byte == 0 ? zeros + 1 : 0;
        payload.push_back(byte);
    }
    return payload;
}

Bytes withEmulation(ByteView payload)
{
    Bytes nal;
    nal.reserve(payload.size() + payload.size() / 64 + 4);
    int zeros = 0;
    for (const std::uint8_t byte : payload) {
        if (zeros >= 2 && byte <= 3) {
            nal.push_back(3);
            zeros = 0;
        }
        zeros = byte == 0 ? zeros + 1 : 0;
        nal.push_back(byte);
    }
    return nal;
}

std::uint32_t BitReader::bit()
{
    const std::size_t at = m_position++;
    if (at >= m_bytes.size() * 8)
        return 0;
    return (m_bytes[at / 8] >> (7 - at % 8)) & 1U;
}

std::uint32_t BitReader::bits(int count)
{
    std::uint32_t value = 0;
    for (int i = 0; i < count; ++i)
        value = value << 1 | bit();
    return value;
}

std::uint32_t BitReader::ue()
{
    int zeros = 0;
    while (zeros < 32 && !isBeyond() && bit() == 0)
        ++zeros;
    if (zeros == 0)
        return 0;
    const std::uint64_t value = (std::uint64_t{1} << zeros) - 1 + bits(zeros);
    return static_cast<std::uint32_t>(value);
}

std::int32_t BitReader::se()
{
    const std::uint32_t code = ue();
    const auto half = static_cast<std::int32_t>((code + 1) / 2);
    return code % 2 ? half : -half;
}

void BitWriter::bit(std::uint32_t value)
{
    if (m_free == 0) {
        m_bytes.push_back(0);
        m_free = 8;
    }
    --m_free;
    m_bytes.back() = static_cast<std::uint8_t>(m_bytes.back() | (value & 1U) << m_free);
}

void BitWriter::bits(std::uint32_t value, int count)
{
    for (int i = count - 1; i >= 0; --i)
        bit(value >> i);
}

void BitWriter::ue(std::uint32_t value)
{
    const int length = std::bit_width(value + 1);
    bits(0, length - 1);
    bits(value + 1, length);
}

void BitWriter::copy(ByteView from, std::size_t begin, std::size_t end)
{
    for (std::size_t at = begin; at < end; ++at)
        bit(static_cast<std::uint32_t>(from[at / 8] >> (7 - at % 8)));
}

void BitWriter::finish()
{
    bit(1);
    m_free = 0;
}

} // namespace ffmpeg

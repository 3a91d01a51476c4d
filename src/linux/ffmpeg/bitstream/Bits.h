/// Bits of a parameter set: reading, and writing what is changed. Values; any thread.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace ffmpeg {

using Bytes = std::vector<std::uint8_t>;
using ByteView = std::span<const std::uint8_t>;

/// What lies between the start codes of a NAL unit, without the bytes that keep start codes from occurring inside.
Bytes withoutEmulation(ByteView nal);
/// The reverse.
Bytes withEmulation(ByteView payload);

/// Reads past the end give zeros, and isBeyond() tells.
class BitReader {
public:
    explicit BitReader(ByteView bytes) : m_bytes(bytes) {}

    std::uint32_t bit();
    /// Up to 32.
    std::uint32_t bits(int count);
    void skip(int count) { m_position += static_cast<std::size_t>(count); }
    /// Exponential Golomb codes.
    std::uint32_t ue();
    std::int32_t se();

    std::size_t position() const { return m_position; }
    bool isBeyond() const { return m_position > m_bytes.size() * 8; }

private:
    ByteView m_bytes;
    std::size_t m_position = 0;
};

class BitWriter {
public:
    void bit(std::uint32_t value);
    void bits(std::uint32_t value, int count);
    void ue(std::uint32_t value);
    /// The bits of `from`, from one position up to another.
    void copy(ByteView from, std::size_t begin, std::size_t end);
    /// The stop bit and the zeros behind it.
    void finish();

    const Bytes& bytes() const { return m_bytes; }

private:
    Bytes m_bytes;
    int m_free = 0; ///< bits of the last byte that are not used yet
};

} // namespace ffmpeg

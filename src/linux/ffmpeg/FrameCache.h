/// Decoded pictures around the playhead, within a bound in bytes. One thread.
#pragma once

#include "linux/ffmpeg/DecodedFrame.h"

#include <cstdint>
#include <map>
#include <optional>

namespace ffmpeg {

/// A picture and the tick at which the next one takes its place.
struct ShownFrame {
    FrameRef frame;
    std::int64_t until;
};

class FrameCache {
public:
    /// All cached pictures together. Large ones take a third of it at most in full, because the decoder keeps the memory
    /// of what it has given out: 14 at 1920 × 1080, and 110 scaled down to 960 × 540.
    static constexpr std::size_t kMostBytes = 128u << 20;

    enum class Overflow { Drop, Reduce };

    explicit FrameCache(std::size_t mostBytes = kMostBytes) : m_mostBytes(mostBytes) {}

    /// Keeps `shown` as it is. What is farthest from `focus` is dropped when a bound is passed; large pictures that are
    /// too many in full can be reduced first. A full picture is not replaced by a reduced one.
    void insert(const ShownFrame& shown, std::int64_t focus, Overflow overflow = Overflow::Drop);
    /// The picture that is visible at `tick`, if it is here.
    std::optional<ShownFrame> at(std::int64_t tick) const;
    /// The picture that is nearest to `tick`; null when there is none.
    FrameRef nearest(std::int64_t tick) const;
    std::size_t byteCount() const { return m_bytes; }
    /// How many pictures like `full` there is room for.
    std::int64_t capacity(const DecodedFrame& full, Overflow overflow) const;

private:
    static constexpr int kReducedLimit = 960;   ///< pixels
    static constexpr std::size_t kKeptFull = 8; ///< pictures, however large

    using Entries = std::map<std::int64_t, ShownFrame>; ///< by the tick of the picture
    void erase(Entries::iterator entry);
    std::size_t fullLimit(const DecodedFrame& picture) const;
    Entries::iterator farthestFull(std::int64_t focus);
    void reduce(Entries::iterator entry);
    static bool isReducible(const DecodedFrame& frame);
    static Entries::iterator farther(Entries::iterator first, Entries::iterator last, std::int64_t focus);

    std::size_t m_mostBytes;
    std::size_t m_bytes = 0;
    std::size_t m_fullCount = 0; ///< pictures that could be reduced
    Entries m_entries;
};

} // namespace ffmpeg

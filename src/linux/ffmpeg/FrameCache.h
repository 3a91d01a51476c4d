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
    /// All cached pictures together: 40 at 1920 × 1080, 165 when scaled down to 960 × 540.
    static constexpr std::size_t kMostBytes = 128u << 20;

    explicit FrameCache(std::size_t mostBytes = kMostBytes) : m_mostBytes(mostBytes) {}

    /// Keeps `shown`; drops the pictures farthest from `focus` when the bound is passed. A full picture is not replaced
    /// by a reduced one.
    void insert(const ShownFrame& shown, std::int64_t focus);
    /// The picture that is visible at `tick`, if it is here.
    std::optional<ShownFrame> at(std::int64_t tick) const;
    std::size_t byteCount() const { return m_bytes; }

private:
    using Entries = std::map<std::int64_t, ShownFrame>; ///< by the tick of the picture
    void erase(Entries::iterator entry);

    std::size_t m_mostBytes;
    std::size_t m_bytes = 0;
    Entries m_entries;
};

} // namespace ffmpeg

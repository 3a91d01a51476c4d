/// Decoded pictures around the playhead, within a bound in bytes. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/DecodedFrame.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <limits>
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
    /// All cached pictures together. Large ones take a quarter of it at most in full, because the decoder keeps the
    /// memory of what it has given out: ten at 1920 × 1080, two at 3840 × 2160. Ten seconds at 60 a second fit when
    /// those that are farthest are small: 613 pictures of 480 × 270 beside four in full.
    static constexpr std::size_t kMostBytes = 128u << 20;

    enum class Overflow { Drop, Reduce };

    explicit FrameCache(std::size_t mostBytes = kMostBytes) : m_mostBytes(mostBytes) {}

    /// Keeps `shown` as it is. When a bound is passed, what is farthest from `focus` is dropped; or, first of all, what
    /// is farther than `reach`, then large pictures are reduced, in steps and the farthest first, before any is dropped.
    /// A picture is not replaced by a smaller one of the same time.
    void insert(const ShownFrame& shown, std::int64_t focus, Overflow overflow = Overflow::Drop,
                std::int64_t reach = std::numeric_limits<std::int64_t>::max());
    /// The picture that is visible at `tick`, if it is here.
    std::optional<ShownFrame> at(std::int64_t tick) const;
    /// The picture that is nearest to `tick`; null when there is none.
    FrameRef nearest(std::int64_t tick) const;
    std::size_t byteCount() const { return m_bytes; }
    /// How many pictures like `full` there is room for.
    std::int64_t capacity(const DecodedFrame& full, Overflow overflow) const;

private:
    static constexpr std::size_t kKeptFull = 2;                  ///< pictures, however large
    static constexpr std::size_t kKeptAmongReduced = 4;          ///< at most, where as many as possible are to fit
    static constexpr std::array<int, 2> kReducedSides{960, 480}; ///< pixels of the longer side, by step

    using Entries = std::map<std::int64_t, ShownFrame>; ///< by the tick of the picture
    void erase(Entries::iterator entry);
    std::size_t fullLimit(const DecodedFrame& picture) const;
    void makeRoom(std::int64_t focus, Overflow overflow, std::int64_t reach);
    Entries::iterator farthest(std::int64_t focus);
    Entries::iterator farthestOf(std::size_t step, std::int64_t focus);
    void reduce(Entries::iterator entry, std::size_t step);
    static std::size_t stepOf(const DecodedFrame& frame);
    static Entries::iterator farther(Entries::iterator first, Entries::iterator last, std::int64_t focus);

    std::size_t m_mostBytes;
    std::size_t m_bytes = 0;
    /// How many pictures can be reduced in so many steps: first those that cannot.
    std::array<std::size_t, kReducedSides.size() + 1> m_counts{};
    Entries m_entries;
    base::Affinity m_affinity = base::Affinity::detached();
};

} // namespace ffmpeg

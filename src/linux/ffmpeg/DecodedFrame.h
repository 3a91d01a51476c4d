/// One decoded picture with what it takes to draw it. Immutable; any thread.
#pragma once

#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/Orientation.h"
#include "platform/media/VideoFrame.h"

#include <cstdint>
#include <memory>

namespace ffmpeg {

/// Whether the scaler has tables of its own for the format, which know no matrix but that of standard definition.
bool isOfPalette(AVPixelFormat format);

class DecodedFrame final : public platform::VideoFrame {
public:
    /// `codedAspect` is the pixels' aspect where the picture itself does not say one.
    DecodedFrame(Owned<AVFrame> picture, std::int64_t pts, base::MediaTime time, Orientation orientation,
                 AVRational codedAspect);

    base::MediaTime time() const override { return m_time; }
    base::Size displaySize() const override { return m_displaySize; }
    bool render(std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height, Quality quality) const override;

    const AVFrame& picture() const { return *m_picture; }
    /// In ticks of the stream.
    std::int64_t pts() const { return m_pts; }
    /// What it keeps in memory.
    std::size_t byteCount() const { return m_byteCount; }
    bool isReduced() const { return m_reduced; }

    /// The same picture, no wider or higher than `limit` pixels, for what is only scrubbed over.
    /// This very picture when it is small already; null when it cannot be scaled.
    static std::shared_ptr<const DecodedFrame> reduced(const std::shared_ptr<const DecodedFrame>& frame, int limit);

private:
    bool renderMapped(SwsContext* context, std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height) const;

    Owned<AVFrame> m_picture;
    std::int64_t m_pts;
    base::MediaTime m_time;
    Orientation m_orientation;
    AVRational m_aspect;
    base::Size m_displaySize;
    std::size_t m_byteCount = 0;
    bool m_reduced = false;
};

using FrameRef = std::shared_ptr<const DecodedFrame>;

} // namespace ffmpeg

/// Brings colours of a high dynamic range to those of the screen. Pure functions; any thread.
#pragma once

#include "linux/ffmpeg/Libraries.h"

#include <cstddef>
#include <cstdint>

namespace ffmpeg {

/// What pictures are mapped from.
struct ToneMap {
    AVColorTransferCharacteristic transfer;
    bool isWide; ///< primaries of BT.2020, else those of the screen
    float peak;  ///< the brightest that there is, more than 1, which is the white of a page

    /// False where the screen can show the picture as it is.
    static bool isNeededFor(const AVFrame& picture);
    static ToneMap of(const AVFrame& picture);

    /// What is mapped: a row of each colour, 10 bits as the movie codes them.
    static constexpr AVPixelFormat kFormat = AV_PIX_FMT_GBRP10;
    struct Row {
        const std::uint16_t* red;
        const std::uint16_t* green;
        const std::uint16_t* blue;
    };
    /// To BGRA of 8 bits.
    void apply(const Row& row, std::uint8_t* bgra, int width) const;
};

} // namespace ffmpeg

/// Brings pictures of any size and format to those that an encoder takes. One thread.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"

namespace ffmpeg {

/// The format nearest to `source` that x264 takes; alpha is left out.
AVPixelFormat formatForH264(AVPixelFormat source);
/// The one that x265 takes, of no less than 10 bits: fewer show steps in a high dynamic range.
AVPixelFormat formatForHdr(AVPixelFormat source);

/// Whether its pictures have no matrix of their own.
bool isRgb(AVPixelFormat format);

class PictureScaler {
public:
    /// `matrix` is what RGB is converted by.
    PictureScaler(AVPixelFormat format, int width, int height, AVColorSpace matrix)
        : m_format(format), m_width(width), m_height(height), m_matrix(matrix)
    {
    }

    /// The picture itself where it fits already, extended by the odd row or column that it lacks; else scaled to the whole
    /// width or height, black beside it.
    base::Result<Owned<AVFrame>> fit(const AVFrame& picture);
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    base::Affinity m_affinity;
    AVPixelFormat m_format;
    int m_width;
    int m_height;
    AVColorSpace m_matrix;
    Owned<SwsContext> m_scaler;
    int m_fromWidth = 0;
    int m_fromHeight = 0;
    int m_fromFormat = -1;
};

} // namespace ffmpeg

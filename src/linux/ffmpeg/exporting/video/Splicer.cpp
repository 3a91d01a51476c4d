#include "linux/ffmpeg/exporting/video/Splicer.h"

#include "linux/ffmpeg/exporting/CannotCopy.h"
#include "linux/ffmpeg/exporting/video/H264Splicer.h"
#include "linux/ffmpeg/exporting/video/HevcSplicer.h"
#include "linux/ffmpeg/exporting/video/KeyframeSplicer.h"

namespace ffmpeg {

base::Result<std::unique_ptr<Splicer>> Splicer::make(const AVStream& stream, const AVFrame& picture)
{
    switch (stream.codecpar->codec_id) {
    case AV_CODEC_ID_H264:
        return H264Splicer::make(stream);
    case AV_CODEC_ID_HEVC:
        return HevcSplicer::make(stream, picture);
    case AV_CODEC_ID_VP9:
    case AV_CODEC_ID_AV1:
        return KeyframeSplicer::make(stream, picture);
    default:
        return cannotCopy(std::string("packets of ") + avcodec_get_name(stream.codecpar->codec_id) + " are not joined");
    }
}

} // namespace ffmpeg

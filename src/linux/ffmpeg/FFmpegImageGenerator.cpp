#include "linux/ffmpeg/FFmpegImageGenerator.h"

#include <utility>

namespace ffmpeg {

std::shared_ptr<FFmpegImageGenerator> FFmpegImageGenerator::make(const std::shared_ptr<Engine>& engine,
                                                                 std::shared_ptr<FFmpegAsset> asset)
{
    return std::shared_ptr<FFmpegImageGenerator>(new FFmpegImageGenerator(engine, std::move(asset)));
}

void FFmpegImageGenerator::generateImagesAsynchronouslyForTimes(const std::vector<base::MediaTime>& times,
                                                                Handler handler)
{
    m_engine->reaper.post([times, handler = std::move(handler)] {
        for (const base::MediaTime& time : times)
            handler(time, nullptr, base::MediaTime::invalid(), Result::Failed,
                    base::Error::make("ffmpeg", AVERROR(ENOSYS), "Pictures cannot be made yet."));
    });
}

} // namespace ffmpeg

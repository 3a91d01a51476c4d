/// Makes pictures of a movie's moments on a worker of its own. Main queue only.
#pragma once

#include "linux/ffmpeg/Engine.h"
#include "linux/ffmpeg/FFmpegAsset.h"
#include "platform/media/ImageGenerator.h"

namespace ffmpeg {

class FFmpegImageGenerator final : public platform::ImageGenerator {
public:
    static std::shared_ptr<FFmpegImageGenerator> make(const std::shared_ptr<Engine>& engine,
                                                      std::shared_ptr<FFmpegAsset> asset);

    void setMaximumSize(base::Size size) override { m_maximumSize = size; }
    base::Size maximumSize() const override { return m_maximumSize; }
    void generateImagesAsynchronouslyForTimes(const std::vector<base::MediaTime>& times, Handler handler) override;

private:
    FFmpegImageGenerator(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegAsset> asset)
        : m_engine(std::move(engine)), m_asset(std::move(asset))
    {
    }

    std::shared_ptr<Engine> m_engine;
    std::shared_ptr<FFmpegAsset> m_asset;
    base::Size m_maximumSize;
};

} // namespace ffmpeg

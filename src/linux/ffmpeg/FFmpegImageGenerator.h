/// Makes pictures of a movie's moments on workers. Main queue only.
///
/// What is asked for within one turn of the main queue is gathered, whatever its order. One handler runs at a time, on a
/// worker; it must not wait for the main queue, because whoever lets the generator go waits for it.
#pragma once

#include "linux/ffmpeg/Engine.h"
#include "linux/ffmpeg/FFmpegAsset.h"
#include "linux/ffmpeg/images/ImageWorkers.h"
#include "platform/media/ImageGenerator.h"

#include <cstdint>
#include <memory>
#include <vector>

namespace ffmpeg {

class FFmpegImageGenerator final : public platform::ImageGenerator {
public:
    static std::shared_ptr<FFmpegImageGenerator> make(const std::shared_ptr<Engine>& engine,
                                                      std::shared_ptr<FFmpegAsset> asset);
    ~FFmpegImageGenerator() override;

    void setMaximumSize(base::Size size) override { here(m_maximumSize) = size; }
    base::Size maximumSize() const override { return here(m_maximumSize); }
    void generateImagesAsynchronouslyForTimes(const std::vector<base::MediaTime>& times, Handler handler) override;

    /// Pictures decoded so far, for tests and measurements.
    std::int64_t decodedCount() const { return here(m_workers) ? m_workers->decodedCount() : 0; }

private:
    FFmpegImageGenerator(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegAsset> asset);

    void begin();

    std::shared_ptr<Engine> m_engine;
    std::shared_ptr<FFmpegAsset> m_asset;
    base::Size m_maximumSize;
    std::vector<ImageWorkers::Request> m_gathered;
    std::unique_ptr<ImageWorkers> m_workers;
};

} // namespace ffmpeg

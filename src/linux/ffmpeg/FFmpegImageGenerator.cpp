#include "linux/ffmpeg/FFmpegImageGenerator.h"

#include "base/HandBack.h"

#include <utility>

namespace ffmpeg {

std::shared_ptr<FFmpegImageGenerator> FFmpegImageGenerator::make(const std::shared_ptr<Engine>& engine,
                                                                 std::shared_ptr<FFmpegAsset> asset)
{
    return std::shared_ptr<FFmpegImageGenerator>(new FFmpegImageGenerator(engine, std::move(asset)));
}

FFmpegImageGenerator::FFmpegImageGenerator(std::shared_ptr<Engine> engine, std::shared_ptr<FFmpegAsset> asset)
    : m_engine(std::move(engine)), m_asset(std::move(asset))
{
}

FFmpegImageGenerator::~FFmpegImageGenerator()
{
    assertHere();
    if (m_workers)
        m_workers->cancel();
    m_engine->retire(std::move(m_workers));
}

void FFmpegImageGenerator::generateImagesAsynchronouslyForTimes(const std::vector<base::MediaTime>& times,
                                                                Handler handler)
{
    assertHere();
    if (times.empty())
        return;
    const bool isFirst = m_gathered.empty();
    // What a handler holds may live on the main queue, and dies there wherever the last picture was made.
    const auto shared =
        base::handedBackTo(m_engine->system.mainQueue, std::make_shared<const Handler>(std::move(handler)));
    for (const base::MediaTime& time : times)
        m_gathered.push_back({time, m_maximumSize, shared});
    if (!isFirst)
        return;
    // Not before the main queue's next turn, when all that is asked for in this one is there.
    m_asset->whenLoaded([weak = weakSelf<FFmpegImageGenerator>()] {
        if (const auto self = weak.lock())
            self->begin();
    });
}

void FFmpegImageGenerator::begin()
{
    if (!m_workers) {
        using Opened = base::Result<std::shared_ptr<const Movie>>;
        const auto& movie = m_asset->movie();
        m_workers = std::make_unique<ImageWorkers>(movie ? Opened(movie) : Opened(m_asset->error()),
                                                   m_engine->options.imageNiceness);
    }
    m_workers->add(std::exchange(m_gathered, {}));
}

} // namespace ffmpeg

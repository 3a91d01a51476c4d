/// A movie that is opened on a worker as soon as it is asked for. Main queue only.
#pragma once

#include "linux/ffmpeg/Engine.h"
#include "platform/media/Asset.h"

#include <functional>
#include <vector>

namespace ffmpeg {

class FFmpegAsset final : public platform::Asset {
public:
    static std::shared_ptr<FFmpegAsset> make(const std::shared_ptr<Engine>& engine, std::optional<base::Url> url);
    /// Gives up opening.
    ~FFmpegAsset() override;

    const std::optional<base::Url>& url() const override { return here(m_url); }
    base::ErrorRef error() const override { return here(m_error); }
    base::MediaTime duration() const override;
    std::vector<platform::AssetTrack> tracks() const override;
    std::optional<platform::CutOff> cutOff() const override;
    void whenLoaded(std::function<void()> then) override;

    /// Null while loading, and when it failed. Everything that reads the movie starts here: see Movie::demuxer.
    const std::shared_ptr<Movie>& movie() const { return here(m_movie); }

private:
    FFmpegAsset(std::shared_ptr<Engine> engine, std::optional<base::Url> url);

    void load();
    void finish(base::Result<std::shared_ptr<Movie>> movie);

    std::shared_ptr<Engine> m_engine;
    std::optional<base::Url> m_url;
    std::shared_ptr<std::atomic<bool>> m_cancelled;
    std::shared_ptr<Movie> m_movie;
    base::ErrorRef m_error;
    std::vector<std::function<void()>> m_waiting;
};

} // namespace ffmpeg

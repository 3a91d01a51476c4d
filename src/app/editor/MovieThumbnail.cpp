#include "app/editor/MovieThumbnail.h"

#include <chrono>
#include <future>
#include <memory>

namespace app {

namespace {

/// The picture is a courtesy; the movie is in the library already.
constexpr std::chrono::seconds kPatience{5};

/// What the main queue and the generator's thread work on, until the picture has come or is given up.
struct Request {
    std::promise<platform::ImageRef> promise;
    std::shared_ptr<platform::ImageGenerator> generator; ///< main queue
};

} // namespace

std::optional<platform::Bitmap> movieThumbnail(base::MainQueue& mainQueue, platform::MediaFramework& media,
                                               const std::string& path, int side)
{
    const auto request = std::make_shared<Request>();
    auto arrived = request->promise.get_future();
    mainQueue.post([request, &media, path, side] {
        request->generator = media.imageGeneratorWithAsset(media.assetWithURL(base::Url::fromPath(path)));
        const auto length = static_cast<double>(side);
        request->generator->setMaximumSize({length, length});
        // Weakly: a request that was given up goes with its generator.
        request->generator->generateImagesAsynchronouslyForTimes(
            {base::MediaTime::zero()},
            [weak = std::weak_ptr(request)](base::MediaTime, const platform::ImageRef& image, base::MediaTime,
                                            platform::ImageGenerator::Result, const base::ErrorRef&) {
                if (const auto waiting = weak.lock())
                    waiting->promise.set_value(image);
            });
    });
    const bool came = arrived.wait_for(kPatience) == std::future_status::ready;
    mainQueue.post([request] { request->generator = nullptr; });
    const platform::ImageRef image = came ? arrived.get() : nullptr;
    return image ? std::optional(image->bitmap()) : std::nullopt;
}

} // namespace app

// The pictures in the scrubber's strip: one request at a time, made once, kept until the item or the turn of the view
// changes.

#include "editor/VKVideoEditorViewController.h"

#include <cmath>

using platform::MovieScrubber;

namespace {

constexpr double kThumbnailHeight = 38.0; // points, as high as the strip
/// Fine enough for a timestamp not to fall before the picture that it means.
constexpr std::int32_t kThumbnailTimescale = 1'000'000'000;

} // namespace

base::Size VKVideoEditorViewController::getVideoSize() const
{
    assertHere();
    const auto item = avPlayer()->currentItem();
    const auto tracks =
        item ? item->asset()->tracksWithMediaType(platform::MediaType::Video) : std::vector<platform::AssetTrack>{};
    if (tracks.empty())
        return {};
    const base::Size size = tracks.front().preferredTransform.apply(tracks.front().naturalSize);
    return {std::abs(size.width), std::abs(size.height)};
}

double VKVideoEditorViewController::movieScrubberThumbnailAspectRatio(MovieScrubber& /*scrubber*/)
{
    assertHere();
    const base::Size size = getVideoSize();
    return size.width > 0 && size.height > 0 ? size.width / size.height : 1.0;
}

base::Size VKVideoEditorViewController::getThumbnailSize() const
{
    assertHere();
    const double scale = m_platform.mainScreen.scale();
    const base::Size size = getVideoSize();
    // Without a picture this is not a number, which bounds nothing.
    const auto ratio = static_cast<float>(size.width / size.height);
    const auto width = static_cast<float>(scale * kThumbnailHeight * static_cast<double>(ratio));
    return {scale * static_cast<double>(std::nearbyint(width)), scale * kThumbnailHeight};
}

void VKVideoEditorViewController::movieScrubber_requestThumbnailImageForTimestamp(MovieScrubber& /*scrubber*/,
                                                                                  double timestamp)
{
    assertHere();
    if (!thumbnailGenerator()) {
        const auto item = avPlayer()->currentItem();
        setThumbnailGenerator(m_platform.media.imageGeneratorWithAsset(item ? item->asset() : nullptr));
        thumbnailGenerator()->setMaximumSize(getThumbnailSize());
    }
    if (!cachedTimeStamps())
        setCachedTimeStamps(std::make_shared<ThumbnailCache>());
    if (cachedTimeStamps()->object(timestamp)) {
        setThumbnailFromCacheWithTimeStamp(timestamp);
        return;
    }
    // The cache of this moment: a picture that comes late must not stand among those of another movie or size.
    thumbnailGenerator()->generateImagesAsynchronouslyForTimes(
        {base::MediaTime::fromSeconds(timestamp, kThumbnailTimescale)},
        [timestamp, cache = cachedTimeStamps(), weak = weakSelf<VKVideoEditorViewController>(),
         &mainQueue = m_platform.system.mainQueue](base::MediaTime, const platform::ImageRef& image, base::MediaTime,
                                                   platform::ImageGenerator::Result, const base::ErrorRef& error) {
            if (error)
                return;
            if (image)
                cache->setObject(image, timestamp);
            handThumbnailOver(mainQueue, weak, timestamp);
        });
}

void VKVideoEditorViewController::setThumbnailFromCacheWithTimeStamp(double timestamp)
{
    assertHere();
    handThumbnailOver(m_platform.system.mainQueue, weakSelf<VKVideoEditorViewController>(), timestamp);
}

void VKVideoEditorViewController::handThumbnailOver(base::MainQueue& mainQueue,
                                                    const std::weak_ptr<VKVideoEditorViewController>& editor,
                                                    double timestamp)
{
    mainQueue.post([editor, timestamp] {
        // Locked here: on the generator's thread it could be the last reference.
        const auto self = editor.lock();
        if (!self || !self->cachedTimeStamps())
            return;
        self->avTrimmer()->setThumbnailImage_forTimestamp(self->cachedTimeStamps()->object(timestamp).value_or(nullptr),
                                                          timestamp);
    });
}

void VKVideoEditorViewController::dropThumbnails()
{
    setThumbnailGenerator(nullptr);
    setCachedTimeStamps(nullptr);
}

// Playing the movie: the chain of asset, item, player and layer, and what the bars show meanwhile.

#include "editor/VKVideoEditorViewController.h"

#include <algorithm>
#include <array>
#include <limits>
#include <string_view>

using base::MediaTime;
using platform::PlayerItem;

namespace {

constexpr double kPlayHeadInterval = 1.0 / 30; // seconds between two moves of the play head
constexpr std::int32_t kPlayHeadTimescale = 1'000'000'000;
/// Of the item: what tells that it is ready.
constexpr std::array<std::string_view, 2> kObservedKeys{PlayerItem::kStatusKey, PlayerItem::kDurationKey};

} // namespace

void VKVideoEditorViewController::buildPlayer()
{
    setAvAsset(m_platform.media.assetWithURL(videoURL()));
    setAvPlayerItem(m_platform.media.playerItemWithAsset(avAsset()));
    setAvPlayer(m_platform.media.playerWithPlayerItem(avPlayerItem()));
}

void VKVideoEditorViewController::observePlayerItem()
{
    for (const std::string_view key : kObservedKeys)
        avPlayer()->currentItem()->addObserver(*this, std::string(key));
}

void VKVideoEditorViewController::stopObservingPlayerItem()
{
    for (const std::string_view key : kObservedKeys)
        avPlayer()->currentItem()->removeObserver(*this, key);
}

void VKVideoEditorViewController::addPlayHeadObserver()
{
    setPlaybackTimeObserver(avPlayer()->addPeriodicTimeObserver(
        MediaTime::fromSeconds(kPlayHeadInterval, kPlayHeadTimescale),
        [weak = weakSelf<VKVideoEditorViewController>()](MediaTime) {
            const auto self = weak.lock();
            if (!self || self->isScrubbing())
                return;
            const auto item = self->avPlayer()->currentItem();
            self->avTrimmer()->setValue(item ? item->currentTime().seconds()
                                             : std::numeric_limits<double>::quiet_NaN());
        }));
}

void VKVideoEditorViewController::reloadAVLayerWithURL(const std::optional<base::Url>& url)
{
    assertHere();
    if (isTrimming())
        if (const auto delegate = avTrimmer()->delegate())
            delegate->movieScrubberDidCancelEditing(*avTrimmer());
    setVideoURL(url);
    stopObservingPlayerItem();
    buildPlayer();
    avPlayer()->setActionAtItemEnd(platform::ActionAtItemEnd::Pause);
    avPlayer()->seekToTime(MediaTime::zero());
    avPlayerLayer()->setPlayer(avPlayer());
    observePlayerItem();
    setCurrentItemLoaded(false);
    setScrubbing(false);
    // The former observer belongs to the former player and goes with it.
    addPlayHeadObserver();
}

void VKVideoEditorViewController::observeValueForKeyPath_ofObject_change_context(
    std::string_view keyPath, runtime::Object& object, const runtime::KeyValueChange& /*change*/, void* /*context*/)
{
    assertHere();
    const auto item = avPlayer()->currentItem();
    if (&object != item.get())
        return;
    if (std::find(kObservedKeys.begin(), kObservedKeys.end(), keyPath) == kObservedKeys.end())
        return;
    if (item->status() != PlayerItem::Status::ReadyToPlay || !item->duration().isNumeric() || currentItemLoaded())
        return;
    setCurrentItemLoaded(true);
    dropThumbnails();
    avTrimmer()->setDelegate(self<VKVideoEditorViewController>());
    avTrimmer()->setDataSource(self<VKVideoEditorViewController>());
    setEditStartTime(0.0);
    setEditEndTime(getPlayerDuration());
    avTrimmer()->reloadData();
}

void VKVideoEditorViewController::itemDidFinishPlaying(const std::shared_ptr<runtime::Object>& /*notification*/)
{
    assertHere();
    pauseAction();
    if (isUIHidden())
        showUI();
    avPlayer()->seekToTime(MediaTime::zero());
}

void VKVideoEditorViewController::playAction()
{
    assertHere();
    platform::Player& player = *avPlayer();
    if (isTrimming()) {
        player.seekToTime(mediaTime(editStartTime()));
        // Former boundaries stay attached to the player, and keep pausing it.
        setTimeObserver(player.addBoundaryTimeObserver({mediaTime(editEndTime())},
                                                       [weak = weakSelf<VKVideoEditorViewController>()] {
                                                           if (const auto self = weak.lock())
                                                               self->pauseAction();
                                                       }));
    }
    player.play();
    if (!isUIHidden())
        hideUI();
    if (isIntroMode()) {
        videoOverlayPlayButton()->asView()->removeFromSuperview();
        setIntroMode(false);
    }
    layOutBars(pauseButton());
}

void VKVideoEditorViewController::pauseAction()
{
    assertHere();
    avPlayer()->pause();
    layOutBars(playButton());
}

void VKVideoEditorViewController::layOutBars(const std::shared_ptr<platform::BarButtonItem>& playOrPause)
{
    if (!isPadMode()) {
        bottomToolBar()->setItems({shareButton(), flexSpace(), playOrPause, flexSpace()});
        return;
    }
    topToolBar()->setItems({isTrimming() ? cancelTrimButton() : cancelButton(), flexSpace(), titleButton(), flexSpace(),
                            playOrPause, fixSpace(), shareButton(), fixSpace(),
                            isTrimming() ? trimButton() : saveButton()});
}

void VKVideoEditorViewController::refreshAVRotation()
{
    assertHere();
    avPlayerLayer()->setFrame(view()->bounds());
    topToolBar()->setFrame(topToolBarFrame());
    bottomToolBar()->setFrame(bottomToolBarFrame());
    dropThumbnails();
    avTrimmer()->reloadData();
}

double VKVideoEditorViewController::getPlayerDuration() const
{
    assertHere();
    const auto item = avPlayer() ? avPlayer()->currentItem() : nullptr;
    if (!item || item->status() != PlayerItem::Status::ReadyToPlay)
        return MediaTime::invalid().seconds();
    return item->duration().seconds();
}

MediaTime VKVideoEditorViewController::mediaTime(double seconds) const
{
    return MediaTime::fromSeconds(seconds, avPlayer() ? avPlayer()->currentTime().timescale : 0);
}

void VKVideoEditorViewController::togglePlayback()
{
    assertHere();
    if (avPlayer()->isPlaying())
        pauseAction();
    else
        playAction();
}

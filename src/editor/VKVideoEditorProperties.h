/// Everything that the editor keeps, each with a plain getter and setter that do nothing else. Main queue only, but for
/// those that say so.
#pragma once

#include "base/Affinity.h"
#include "base/SharedDictionary.h"
#include "base/SharedValue.h"
#include "overlay/VKVideoOverlayButton.h"
#include "platform/media/Asset.h"
#include "platform/media/ExportSession.h"
#include "platform/media/ImageGenerator.h"
#include "platform/media/Player.h"
#include "platform/media/PlayerItem.h"
#include "platform/media/PlayerLayer.h"
#include "platform/views/BackdropView.h"
#include "platform/views/Label.h"
#include "platform/views/MovieScrubber.h"
#include "platform/views/Toolbar.h"

#include <atomic>
#include <memory>
#include <optional>
#include <string>
#include <vector>

/// Activity types that the user completed, in order; the same one can stand there twice.
using ActivityTypes = std::vector<std::string>;

/// Pictures for the scrubber's strip by the timestamp that it asked for; written by the generator's thread.
using ThumbnailCache = base::SharedDictionary<double, platform::ImageRef>;

class VKVideoEditorProperties {
public:
    // Flags.
    /// The player's item was found ready, and the scrubber was wired to it.
    bool currentItemLoaded() const { return here(m_currentItemLoaded); }
    void setCurrentItemLoaded(bool currentItemLoaded) { here(m_currentItemLoaded) = currentItemLoaded; }
    /// A trim export is running.
    bool isExporting() const { return here(m_exporting); }
    void setExporting(bool exporting) { here(m_exporting) = exporting; }
    /// The user's finger is on the scrubber.
    bool isScrubbing() const { return here(m_scrubbing); }
    void setScrubbing(bool scrubbing) { here(m_scrubbing) = scrubbing; }
    /// Trim mode is on.
    bool isTrimming() const { return here(m_trimming); }
    void setTrimming(bool trimming) { here(m_trimming) = trimming; }
    /// The pad arrangement is in force.
    bool isPadMode() const { return here(m_padMode); }
    void setPadMode(bool padMode) { here(m_padMode) = padMode; }
    /// The movie has not been played since the editor opened.
    bool isIntroMode() const { return here(m_introMode); }
    void setIntroMode(bool introMode) { here(m_introMode) = introMode; }
    /// Toolbars and scrubber are faded out, or on their way there.
    bool isUIHidden() const { return here(m_uiHidden); }
    void setUiHidden(bool uiHidden) { here(m_uiHidden) = uiHidden; }
    /// The share sheet is on screen.
    bool isShareSheetUp() const { return here(m_shareSheetUp); }
    void setShareSheetUp(bool shareSheetUp) { here(m_shareSheetUp) = shareSheetUp; }
    /// Trim mode was entered at least once. Any thread.
    bool hasEdit() const { return m_hasEdit; }
    void setHasEdit(bool hasEdit) { m_hasEdit = hasEdit; }
    /// The device has a physical home button. Any thread.
    bool hasHomeButton() const { return m_hasHomeButton; }
    void setHasHomeButton(bool hasHomeButton) { m_hasHomeButton = hasHomeButton; }

    // Where the trim handles are, in seconds.
    double editStartTime() const { return here(m_editStartTime); }
    void setEditStartTime(double seconds) { here(m_editStartTime) = seconds; }
    double editEndTime() const { return here(m_editEndTime); }
    void setEditEndTime(double seconds) { here(m_editEndTime) = seconds; }

    // Objects.
    /// An extra file to share with the movie.
    const std::optional<base::Url>& fileAttachmentURL() const { return here(m_fileAttachmentURL); }
    void setFileAttachmentURL(std::optional<base::Url> fileAttachmentURL)
    {
        here(m_fileAttachmentURL) = std::move(fileAttachmentURL);
    }
    /// Replaces the default share message.
    const std::optional<std::string>& overrideShareMessage() const { return here(m_overrideShareMessage); }
    void setOverrideShareMessage(std::optional<std::string> overrideShareMessage)
    {
        here(m_overrideShareMessage) = std::move(overrideShareMessage);
    }
    /// The movie now shown. Any thread: saving replaces it on the thread of its export.
    std::optional<base::Url> videoURL() const { return m_videoURL.value(); }
    void setVideoURL(std::optional<base::Url> videoURL) { m_videoURL.setValue(std::move(videoURL)); }
    /// The movie as received.
    const std::optional<base::Url>& originalVideoURL() const { return here(m_originalVideoURL); }
    void setOriginalVideoURL(std::optional<base::Url> originalVideoURL)
    {
        here(m_originalVideoURL) = std::move(originalVideoURL);
    }
    /// The recorded app's display name, shown as the title.
    const std::optional<std::string>& applicationName() const { return here(m_applicationName); }
    void setApplicationName(std::optional<std::string> applicationName)
    {
        here(m_applicationName) = std::move(applicationName);
    }
    /// The recorded app's bundle identifier.
    const std::optional<std::string>& bundleIdentifier() const { return here(m_bundleIdentifier); }
    void setBundleIdentifier(std::optional<std::string> bundleIdentifier)
    {
        here(m_bundleIdentifier) = std::move(bundleIdentifier);
    }
    /// The asset of `videoURL`.
    const std::shared_ptr<platform::Asset>& avAsset() const { return here(m_avAsset); }
    void setAvAsset(std::shared_ptr<platform::Asset> avAsset) { here(m_avAsset) = std::move(avAsset); }
    /// The item that plays `avAsset`.
    const std::shared_ptr<platform::PlayerItem>& avPlayerItem() const { return here(m_avPlayerItem); }
    void setAvPlayerItem(std::shared_ptr<platform::PlayerItem> avPlayerItem)
    {
        here(m_avPlayerItem) = std::move(avPlayerItem);
    }
    /// Plays `avPlayerItem`.
    const std::shared_ptr<platform::Player>& avPlayer() const { return here(m_avPlayer); }
    void setAvPlayer(std::shared_ptr<platform::Player> avPlayer) { here(m_avPlayer) = std::move(avPlayer); }
    /// Draws `avPlayer`.
    const std::shared_ptr<platform::PlayerLayer>& avPlayerLayer() const { return here(m_avPlayerLayer); }
    void setAvPlayerLayer(std::shared_ptr<platform::PlayerLayer> avPlayerLayer)
    {
        here(m_avPlayerLayer) = std::move(avPlayerLayer);
    }
    /// Moves the play head while playing.
    const platform::Player::ObserverToken& playbackTimeObserver() const { return here(m_playbackTimeObserver); }
    void setPlaybackTimeObserver(platform::Player::ObserverToken playbackTimeObserver)
    {
        here(m_playbackTimeObserver) = std::move(playbackTimeObserver);
    }
    /// The latest boundary at the end of a trim range.
    const platform::Player::ObserverToken& timeObserver() const { return here(m_timeObserver); }
    void setTimeObserver(platform::Player::ObserverToken timeObserver)
    {
        here(m_timeObserver) = std::move(timeObserver);
    }
    /// The blurred strip that holds the scrubber.
    const std::shared_ptr<platform::BackdropView>& scrubberContainterView() const
    {
        return here(m_scrubberContainterView);
    }
    void setScrubberContainterView(std::shared_ptr<platform::BackdropView> scrubberContainterView)
    {
        here(m_scrubberContainterView) = std::move(scrubberContainterView);
    }
    /// Thumbnails, play head, trim handles.
    const std::shared_ptr<platform::MovieScrubber>& avTrimmer() const { return here(m_avTrimmer); }
    void setAvTrimmer(std::shared_ptr<platform::MovieScrubber> avTrimmer) { here(m_avTrimmer) = std::move(avTrimmer); }
    const std::shared_ptr<platform::Toolbar>& topToolBar() const { return here(m_topToolBar); }
    void setTopToolBar(std::shared_ptr<platform::Toolbar> topToolBar) { here(m_topToolBar) = std::move(topToolBar); }
    const std::shared_ptr<platform::Toolbar>& bottomToolBar() const { return here(m_bottomToolBar); }
    void setBottomToolBar(std::shared_ptr<platform::Toolbar> bottomToolBar)
    {
        here(m_bottomToolBar) = std::move(bottomToolBar);
    }
    const std::shared_ptr<platform::BarButtonItem>& shareButton() const { return here(m_shareButton); }
    void setShareButton(std::shared_ptr<platform::BarButtonItem> shareButton)
    {
        here(m_shareButton) = std::move(shareButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& undoButton() const { return here(m_undoButton); }
    void setUndoButton(std::shared_ptr<platform::BarButtonItem> undoButton)
    {
        here(m_undoButton) = std::move(undoButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& pauseButton() const { return here(m_pauseButton); }
    void setPauseButton(std::shared_ptr<platform::BarButtonItem> pauseButton)
    {
        here(m_pauseButton) = std::move(pauseButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& playButton() const { return here(m_playButton); }
    void setPlayButton(std::shared_ptr<platform::BarButtonItem> playButton)
    {
        here(m_playButton) = std::move(playButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& doneButton() const { return here(m_doneButton); }
    void setDoneButton(std::shared_ptr<platform::BarButtonItem> doneButton)
    {
        here(m_doneButton) = std::move(doneButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& saveButton() const { return here(m_saveButton); }
    void setSaveButton(std::shared_ptr<platform::BarButtonItem> saveButton)
    {
        here(m_saveButton) = std::move(saveButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& cancelButton() const { return here(m_cancelButton); }
    void setCancelButton(std::shared_ptr<platform::BarButtonItem> cancelButton)
    {
        here(m_cancelButton) = std::move(cancelButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& cancelTrimButton() const { return here(m_cancelTrimButton); }
    void setCancelTrimButton(std::shared_ptr<platform::BarButtonItem> cancelTrimButton)
    {
        here(m_cancelTrimButton) = std::move(cancelTrimButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& trimButton() const { return here(m_trimButton); }
    void setTrimButton(std::shared_ptr<platform::BarButtonItem> trimButton)
    {
        here(m_trimButton) = std::move(trimButton);
    }
    const std::shared_ptr<platform::BarButtonItem>& flexSpace() const { return here(m_flexSpace); }
    void setFlexSpace(std::shared_ptr<platform::BarButtonItem> flexSpace) { here(m_flexSpace) = std::move(flexSpace); }
    const std::shared_ptr<platform::BarButtonItem>& fixSpace() const { return here(m_fixSpace); }
    void setFixSpace(std::shared_ptr<platform::BarButtonItem> fixSpace) { here(m_fixSpace) = std::move(fixSpace); }
    const std::shared_ptr<platform::BarButtonItem>& titleButton() const { return here(m_titleButton); }
    void setTitleButton(std::shared_ptr<platform::BarButtonItem> titleButton)
    {
        here(m_titleButton) = std::move(titleButton);
    }
    /// Transparent, takes single taps.
    const std::shared_ptr<platform::View>& videoOverlay() const { return here(m_videoOverlay); }
    void setVideoOverlay(std::shared_ptr<platform::View> videoOverlay)
    {
        here(m_videoOverlay) = std::move(videoOverlay);
    }
    /// The large play button.
    const std::shared_ptr<VKVideoOverlayButton>& videoOverlayPlayButton() const
    {
        return here(m_videoOverlayPlayButton);
    }
    void setVideoOverlayPlayButton(std::shared_ptr<VKVideoOverlayButton> videoOverlayPlayButton)
    {
        here(m_videoOverlayPlayButton) = std::move(videoOverlayPlayButton);
    }
    /// The app's name, with the recording's date below it.
    const std::shared_ptr<platform::Label>& titleLabel() const { return here(m_titleLabel); }
    void setTitleLabel(std::shared_ptr<platform::Label> titleLabel) { here(m_titleLabel) = std::move(titleLabel); }
    /// Where a trim writes its result.
    const std::optional<base::Url>& trimFilePath() const { return here(m_trimFilePath); }
    void setTrimFilePath(std::optional<base::Url> trimFilePath) { here(m_trimFilePath) = std::move(trimFilePath); }
    /// The running trim export, or the last one.
    const std::shared_ptr<platform::ExportSession>& exportSession() const { return here(m_exportSession); }
    void setExportSession(std::shared_ptr<platform::ExportSession> exportSession)
    {
        here(m_exportSession) = std::move(exportSession);
    }
    /// Of the item's asset; null until the scrubber asks for a picture.
    const std::shared_ptr<platform::ImageGenerator>& thumbnailGenerator() const { return here(m_thumbnailGenerator); }
    void setThumbnailGenerator(std::shared_ptr<platform::ImageGenerator> thumbnailGenerator)
    {
        here(m_thumbnailGenerator) = std::move(thumbnailGenerator);
    }
    /// All pictures that `thumbnailGenerator` made; null before the first was asked for.
    const std::shared_ptr<ThumbnailCache>& cachedTimeStamps() const { return m_cachedTimeStamps; }
    void setCachedTimeStamps(std::shared_ptr<ThumbnailCache> cachedTimeStamps)
    {
        m_cachedTimeStamps = std::move(cachedTimeStamps);
    }
    /// Completed share activities, in order; handed on by reference.
    const std::shared_ptr<ActivityTypes>& activityTypes() const { return here(m_activityTypes); }
    void setActivityTypes(std::shared_ptr<ActivityTypes> activityTypes)
    {
        here(m_activityTypes) = std::move(activityTypes);
    }

protected:
    VKVideoEditorProperties() = default;
    ~VKVideoEditorProperties() = default;

private:
    /// The member, on the thread that made it. First thing in each entry point but for those of any thread.
    template <typename T> T& here(T& member, base::SourceLocation where = base::SourceLocation::current()) const
    {
        m_affinity.assertHere(where);
        return member;
    }

    base::Affinity m_affinity;
    bool m_currentItemLoaded = false;
    bool m_exporting = false;
    bool m_scrubbing = false;
    bool m_trimming = false;
    bool m_padMode = false;
    bool m_introMode = true;
    bool m_uiHidden = false;
    bool m_shareSheetUp = false;
    std::atomic<bool> m_hasEdit = false;
    std::atomic<bool> m_hasHomeButton = false;
    double m_editStartTime = 0;
    double m_editEndTime = 0;
    std::optional<base::Url> m_fileAttachmentURL;
    std::optional<std::string> m_overrideShareMessage;
    base::SharedValue<std::optional<base::Url>> m_videoURL;
    std::optional<base::Url> m_originalVideoURL;
    std::optional<std::string> m_applicationName;
    std::optional<std::string> m_bundleIdentifier;
    std::shared_ptr<platform::Asset> m_avAsset;
    std::shared_ptr<platform::PlayerItem> m_avPlayerItem;
    std::shared_ptr<platform::Player> m_avPlayer;
    std::shared_ptr<platform::PlayerLayer> m_avPlayerLayer;
    platform::Player::ObserverToken m_playbackTimeObserver;
    platform::Player::ObserverToken m_timeObserver;
    std::shared_ptr<platform::BackdropView> m_scrubberContainterView;
    std::shared_ptr<platform::MovieScrubber> m_avTrimmer;
    std::shared_ptr<platform::Toolbar> m_topToolBar;
    std::shared_ptr<platform::Toolbar> m_bottomToolBar;
    std::shared_ptr<platform::BarButtonItem> m_shareButton;
    std::shared_ptr<platform::BarButtonItem> m_undoButton;
    std::shared_ptr<platform::BarButtonItem> m_pauseButton;
    std::shared_ptr<platform::BarButtonItem> m_playButton;
    std::shared_ptr<platform::BarButtonItem> m_doneButton;
    std::shared_ptr<platform::BarButtonItem> m_saveButton;
    std::shared_ptr<platform::BarButtonItem> m_cancelButton;
    std::shared_ptr<platform::BarButtonItem> m_cancelTrimButton;
    std::shared_ptr<platform::BarButtonItem> m_trimButton;
    std::shared_ptr<platform::BarButtonItem> m_flexSpace;
    std::shared_ptr<platform::BarButtonItem> m_fixSpace;
    std::shared_ptr<platform::BarButtonItem> m_titleButton;
    std::shared_ptr<platform::View> m_videoOverlay;
    std::shared_ptr<VKVideoOverlayButton> m_videoOverlayPlayButton;
    std::shared_ptr<platform::Label> m_titleLabel;
    std::optional<base::Url> m_trimFilePath;
    std::shared_ptr<platform::ExportSession> m_exportSession;
    std::shared_ptr<platform::ImageGenerator> m_thumbnailGenerator;
    std::shared_ptr<ThumbnailCache> m_cachedTimeStamps;
    std::shared_ptr<ActivityTypes> m_activityTypes;
};

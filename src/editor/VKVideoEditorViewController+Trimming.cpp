// The scrubber's questions and answers, and the way into trim mode and out of it.

#include "editor/VKVideoEditorViewController.h"

#include "base/HandBack.h"
#include "support/TempMovieNames.h"
#include "support/VKFileManagerExtensions.h"

using platform::MovieScrubber;
using runtime::Selector;

namespace {

constexpr double kArrowStep = 1; // seconds, of an arrow key

} // namespace

void VKVideoEditorViewController::movieScrubberDidBeginEditing(MovieScrubber& /*scrubber*/)
{
    assertHere();
    editMode();
    setTrimming(true);
}

void VKVideoEditorViewController::movieScrubberDidCancelEditing(MovieScrubber& /*scrubber*/)
{
    assertHere();
    avTrimmer()->setEditing_animated(false, true);
    previewMode();
    setTrimming(false);
}

void VKVideoEditorViewController::editMode()
{
    assertHere();
    if (isPadMode()) {
        topToolBar()->setItems(
            {cancelTrimButton(), flexSpace(), titleButton(), flexSpace(), playButton(), fixSpace(), trimButton()});
    } else {
        bottomToolBar()->setItems({flexSpace(), playButton(), flexSpace()});
        topToolBar()->setItems({cancelTrimButton(), flexSpace(), titleButton(), flexSpace(), trimButton()});
    }
    // Already on entering, before anything is cut.
    setHasEdit(true);
}

void VKVideoEditorViewController::previewMode()
{
    assertHere();
    const auto close = hasEdit() ? doneButton() : cancelButton();
    if (isPadMode()) {
        topToolBar()->setItems({close, flexSpace(), titleButton(), flexSpace(), playButton(), fixSpace(), shareButton(),
                                fixSpace(), saveButton()});
    } else {
        bottomToolBar()->setItems({shareButton(), flexSpace(), playButton(), flexSpace()});
        topToolBar()->setItems({close, flexSpace(), titleButton(), flexSpace(), saveButton()});
    }
}

void VKVideoEditorViewController::undoAction()
{
    assertHere();
    if (isExporting())
        return;
    if (const auto delegate = avTrimmer()->delegate())
        delegate->movieScrubberDidCancelEditing(*avTrimmer());
}

void VKVideoEditorViewController::movieScrubber_editingStartValueDidChange(MovieScrubber& /*scrubber*/, double seconds)
{
    assertHere();
    avPlayer()->pause();
    setEditStartTime(seconds);
    m_platform.system.mainQueue.post([weak = weakSelf<VKVideoEditorViewController>(), seconds] {
        if (const auto self = weak.lock())
            self->avPlayer()->seekToTime(self->mediaTime(seconds));
    });
    setTrimming(true);
}

void VKVideoEditorViewController::movieScrubber_editingEndValueDidChange(MovieScrubber& /*scrubber*/, double seconds)
{
    assertHere();
    avPlayer()->pause();
    setEditEndTime(seconds);
    m_platform.system.mainQueue.post([weak = weakSelf<VKVideoEditorViewController>(), seconds] {
        if (const auto self = weak.lock())
            self->avPlayer()->seekToTime(self->mediaTime(seconds));
    });
    setTrimming(true);
}

void VKVideoEditorViewController::movieScrubberDidBeginScrubbing_withHandle(MovieScrubber& /*scrubber*/, int /*handle*/)
{
    assertHere();
    setScrubbing(true);
    pauseAction();
}

void VKVideoEditorViewController::movieScrubber_valueDidChange(MovieScrubber& /*scrubber*/, double seconds)
{
    assertHere();
    avPlayer()->seekToTime(mediaTime(seconds));
}

void VKVideoEditorViewController::movieScrubberDidEndScrubbing_withHandle(MovieScrubber& /*scrubber*/, int /*handle*/)
{
    assertHere();
    avPlayer()->seekToTime(mediaTime(avTrimmer()->value()));
    setScrubbing(false);
}

double VKVideoEditorViewController::movieScrubberDuration(MovieScrubber& /*scrubber*/)
{
    assertHere();
    return getPlayerDuration();
}

std::vector<double> VKVideoEditorViewController::movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(
    MovieScrubber& /*scrubber*/, std::int32_t count, double start, double end)
{
    assertHere();
    if (end == 0.0)
        return {0.0};
    std::vector<double> timestamps;
    const double duration = getPlayerDuration();
    const double step = (end - start) / count;
    double time = start;
    for (std::int32_t i = 0; i < count; ++i) {
        timestamps.push_back(time);
        time += step;
        // Written so that a duration that is not a number ends after the first.
        if (!(time <= duration))
            break;
    }
    return timestamps;
}

base::Url VKVideoEditorViewController::trimFileURL() const
{
    assertHere();
    const std::string name = support::trimmedMovieName(applicationName().value_or(""));
    return support::tempMovieUrl(support::tempMovieStem(VKExtensions::_srTempPath(m_platform.files), name),
                                 m_platform.system.clock.date());
}

void VKVideoEditorViewController::trimVideo()
{
    assertHere();
    // After an earlier trim this is the file that the export below reads. It stays readable: the player has it open.
    if (trimFilePath())
        VKExtensions::_srRemoveFile_completion(m_platform.files, *trimFilePath(), {});
    setExporting(true);
    setExportSession(m_platform.media.exportSessionWithAsset(m_platform.media.assetWithURL(videoURL()),
                                                             platform::ExportPreset::HighestQuality));
    setTrimFilePath(trimFileURL());
    exportSession()->setOutputURL(trimFilePath());
    exportSession()->setOutputFileType(platform::FileType::Mpeg4);
    // The duration is the end itself, not its distance from the start: a late start runs past the end handle.
    exportSession()->setTimeRange(base::MediaTimeRange{mediaTime(editStartTime()), mediaTime(editEndTime())});
    // A session lives until it has told its end, so that the callback need not hold it, which would be a circle.
    exportSession()->exportAsynchronously(
        [self = base::handedBackTo(m_platform.system.mainQueue, this->self<VKVideoEditorViewController>()),
         &session = *exportSession()] { self->exportEnded(session); });
}

void VKVideoEditorViewController::exportEnded(const platform::ExportSession& session)
{
    // On the session's thread.
    switch (session.status()) {
    case platform::ExportSession::Status::Failed: {
        const auto error = session.error();
        m_platform.system.log.error("VQVideoEditorViewController: Export Trim Video Failed, due to error: "
                                    + std::to_string(error ? error->code32() : 0));
        break;
    }
    case platform::ExportSession::Status::Cancelled:
        m_platform.system.log.error("VQVideoEditorViewController: Export Trim Video Cancelled");
        break;
    default:
        m_platform.system.mainQueue.run([&] { showTrimmedMovie(session.outputURL()); });
    }
}

void VKVideoEditorViewController::showTrimmedMovie(const std::optional<base::Url>& url)
{
    setExporting(false);
    m_platform.notifications.removeObserver(*this);
    reloadAVLayerWithURL(url);
    m_platform.notifications.addObserver(self<runtime::Object>(), Selector("itemDidFinishPlaying:"),
                                         platform::kPlayerItemDidPlayToEndNotification, avPlayerItem());
}

void VKVideoEditorViewController::seekBackward()
{
    assertHere();
    avTrimmer()->scrubTo(avTrimmer()->value() - kArrowStep);
}

void VKVideoEditorViewController::seekForward()
{
    assertHere();
    avTrimmer()->scrubTo(avTrimmer()->value() + kArrowStep);
}

void VKVideoEditorViewController::stepBackward()
{
    assertHere();
    pauseAction();
    avPlayer()->stepByCount(-1);
}

void VKVideoEditorViewController::stepForward()
{
    assertHere();
    pauseAction();
    avPlayer()->stepByCount(1);
}

void VKVideoEditorViewController::goToStart()
{
    assertHere();
    avTrimmer()->scrubTo(0);
}

void VKVideoEditorViewController::goToEnd()
{
    assertHere();
    avTrimmer()->scrubTo(avTrimmer()->duration());
}

void VKVideoEditorViewController::trimStartHere()
{
    assertHere();
    avTrimmer()->moveHandle(platform::ScrubberHandle::Start, avTrimmer()->value());
}

void VKVideoEditorViewController::trimEndHere()
{
    assertHere();
    avTrimmer()->moveHandle(platform::ScrubberHandle::End, avTrimmer()->value());
}

void VKVideoEditorViewController::confirmTrim()
{
    assertHere();
    using Status = platform::ExportSession::Status;
    const auto status = exportSession() ? exportSession()->status() : Status::Unknown;
    const bool isUnderWay = isExporting() && (status == Status::Waiting || status == Status::Exporting);
    // A key is soon pressed twice.
    if (isTrimming() && !isUnderWay)
        saveAction();
}

// Leaving the editor: what was done is kept, and the delegate is told what the user completed.

#include "editor/VKVideoEditorViewController.h"

#include "base/HandBack.h"
#include "platform/sharing/ActivityTypes.h"
#include "publishing/VKAudioMixUtility.h"
#include "support/VKFileManagerExtensions.h"

void VKVideoEditorViewController::doneAction()
{
    assertHere();
    if (isShareSheetUp())
        return;
    avPlayer()->pause();
    if (const auto delegate = this->delegate())
        delegate->videoEditor_didFinishWithActivityTypes(*this, activityTypes());
}

void VKVideoEditorViewController::saveAction()
{
    assertHere();
    if (isShareSheetUp())
        return;
    m_platform.system.log.message("saveAction");
    // Before anything is saved, and also for a trim: every confirmed trim adds one entry.
    activityTypes()->push_back(platform::kActivityTypeSaveToCameraRoll);
    if (isTrimming()) {
        trimVideo();
        return;
    }
    // The editor stays until the library has the movie, whoever else lets go of it: its end empties the store.
    VKAudioMixUtility::mixAudioForMovie_withCompletionHandler(
        m_platform, videoURL(),
        [self = base::handedBackTo(m_platform.system.mainQueue, this->self<VKVideoEditorViewController>())](
            const std::optional<base::Url>& output, const base::ErrorRef& error) { saveMixed(self, output, error); });
}

/// On the thread of the mix; at once, when there was no movie.
void VKVideoEditorViewController::saveMixed(const std::shared_ptr<VKVideoEditorViewController>& self,
                                            const std::optional<base::Url>& output, const base::ErrorRef& error)
{
    const platform::Platform& platform = self->m_platform;
    if (error) {
        platform.system.log.error("Error Mixing video Audio tracks"); // whoever mixed has said why
    } else {
        if (const auto former = self->videoURL())
            VKExtensions::_srRemoveFile_completion(platform.files, *former, [](const base::ErrorRef&) {});
        self->setVideoURL(output);
    }
    platform.photos.performChanges(
        [self](platform::PhotoLibraryChange& change) { change.createAssetFromVideoAtFileURL(self->videoURL()); },
        [self](bool /*success*/, const base::ErrorRef& writeError) {
            self->m_platform.system.mainQueue.post([self, writeError] { self->savedToLibrary(writeError); });
        });
}

void VKVideoEditorViewController::savedToLibrary(const base::ErrorRef& error)
{
    if (error) // the library has said why
        m_platform.system.log.error("Error writing video to camera roll: " + std::to_string(error->code32()));
    doneAction();
}

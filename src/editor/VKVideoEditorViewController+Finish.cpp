// Leaving the editor: what was done is kept, and the delegate is told what the user completed.

#include "editor/VKVideoEditorViewController.h"

#include "platform/hosting/ActivityType.h"

void VKVideoEditorViewController::doneAction()
{
    if (isShareSheetUp())
        return;
    avPlayer()->pause();
    if (const auto delegate = this->delegate())
        delegate->videoEditor_didFinishWithActivityTypes(*this, activityTypes());
}

void VKVideoEditorViewController::saveAction()
{
    if (isShareSheetUp())
        return;
    m_platform.system.log.message("saveAction");
    // Before anything is saved, and also for a trim: every confirmed trim adds one entry.
    activityTypes()->push_back(platform::kActivityTypeSaveToCameraRoll);
    if (isTrimming()) {
        trimVideo();
        return;
    }
}

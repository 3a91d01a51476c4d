// Leaving the editor: the delegate is told what the user completed.

#include "editor/VKVideoEditorViewController.h"

void VKVideoEditorViewController::doneAction()
{
    if (isShareSheetUp())
        return;
    avPlayer()->pause();
    if (const auto delegate = this->delegate())
        delegate->videoEditor_didFinishWithActivityTypes(*this, activityTypes());
}

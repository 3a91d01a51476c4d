// What a script can wait for.

#include "app/editor/Script.h"

#include "app/editor/EditorProgram.h"
#include "editor/VKVideoEditorViewController.h"
#include "linux/qt/items/WorkLine.h"
#include "platform/views/Presentation.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace app {

bool Script::waitFor(const std::string& what)
{
    if (what == "waiting")
        return true; // it is not started earlier
    if (what == "busy")
        return m_program.presenter().workLine().isUnderWay() && m_program.presenter().workLine().width() > 0;
    if (what == "still") {
        m_program.presenter().commit();
        const auto above = m_program.window().topPresentation();
        return !m_program.presenter().isAnimating() && !(above && above->isMoving());
    }
    const auto editor = m_program.editor();
    if (!editor)
        return false;
    if (what == "picture") {
        if (editor->currentItemLoaded() && editor->avAsset()->tracksWithMediaType(platform::MediaType::Video).empty())
            fail("the movie has no pictures to show, only sound");
        return m_program.hasShownPicture();
    }
    if (what == "ready")
        return editor->currentItemLoaded() || editor->avPlayerItem()->status() == platform::PlayerItem::Status::Failed;
    if (what == "thumbnails") {
        const auto& wanted = editor->avTrimmer()->timestamps();
        const auto& here = editor->avTrimmer()->thumbnails();
        return !wanted.empty()
               && std::all_of(wanted.begin(), wanted.end(), [&](double timestamp) { return here.contains(timestamp); });
    }
    if (what == "zoomed")
        return editor->avTrimmer()->isZoomed();
    if (what == "fine") {
        const auto frame = editor->avPlayer()->currentFrame();
        return frame && !ffmpeg::FFmpegMediaFramework::isReduced(*frame);
    }
    if (what == "sheet")
        return editor->isShareSheetUp();
    if (what == "alert")
        return editor->presentedViewController() && editor->presentedViewController()->presentedViewController();
    if (what == "editor") {
        // What a sheet leaves to be done when it goes is done by the next look.
        const bool isAlone = !editor->presentedViewController();
        return std::exchange(m_wasAlone, isAlone) && isAlone;
    }
    if (what == "trimming")
        return editor->isTrimming();
    if (what == "trimmed")
        return !editor->isTrimming() && editor->currentItemLoaded();
    if (what == "hidden" || what == "shown") // and what the fade takes
        return editor->isUIHidden() == (what == "hidden")
               && m_program.system().clock.now() - *m_since > VKVideoEditorViewController::kFadeDuration;
    return false;
}

bool Script::waitForFrame(const Words& words)
{
    constexpr double kLongestFrame = 0.5; // seconds
    constexpr base::Instant kStill = std::chrono::seconds(3);
    const auto editor = m_program.editor();
    const auto frame = editor ? editor->avPlayer()->currentFrame() : nullptr;
    if (!frame)
        return false;
    if (words.size() > 2)
        return frame->time().seconds() >= std::strtod(words[2].c_str(), nullptr);
    // A recording that stands still has one picture for a long time, and one that begins late has its first picture
    // before that: what does not change any more is the one.
    const base::Instant now = m_program.system().clock.now();
    if (m_waitedFrame.lock() != frame || m_waitedSince < *m_since) {
        m_waitedFrame = frame;
        m_waitedSince = now;
    }
    const double since = editor->avPlayer()->currentTime().seconds() - frame->time().seconds();
    return (since >= 0 && since < kLongestFrame) || now - m_waitedSince > kStill;
}

} // namespace app

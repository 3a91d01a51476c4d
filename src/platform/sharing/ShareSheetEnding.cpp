// How a share sheet ends: closed by the user, done, or with an error to tell.
#include "platform/sharing/ShareSheet.h"

#include "platform/sharing/ActivityRow.h"
#include "platform/sharing/QuietText.h"
#include "platform/sharing/ShareListView.h"
#include "platform/views/AlertController.h"

#include <utility>

namespace platform {

namespace {

/// The same, with names that stay in one piece, in whatever direction they and the words around them run.
base::ErrorRef quieted(const base::Error& error)
{
    const auto plain = base::Error::make(error.domain(), error.code(), quietText(error.description()));
    base::Error::UserInfo places = error.userInfo();
    const auto key = places.extract(base::Error::kMessageKey);
    if (key.empty())
        return plain;
    for (auto& [place, text] : places)
        text = quietName(text);
    return base::Error::withMessage(plain, key.mapped(), std::move(places));
}

} // namespace

void ShareSheet::showError(const Activity& activity, const base::ErrorRef& error)
{
    const MessageCatalog& words = m_services.words;
    const auto alert = std::make_shared<AlertController>(
        words.text("SHARE_FAILED", {{"name", quietName(activity.activityTitle())}}), wordsFor(*quieted(*error), words));
    alert->addAction({words.text("SHARE_OK"), AlertAction::Style::Default});
    present(alert, true);
}

void ShareSheet::cancelPressed()
{
    assertHere();
    if (!m_running)
        return;
    const auto keepAlive = shared_from_this();
    if (const auto row = runningRow())
        row->showCancelling();
    const auto running = m_running;
    running->cancel();
}

void ShareSheet::closePressed()
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (presentationShouldClose())
        close();
}

bool ShareSheet::presentationShouldClose()
{
    assertHere();
    if (m_isClosing)
        return false;
    if (!m_running)
        return true;
    const auto keepAlive = shared_from_this();
    m_isClosing = true;
    m_services.mainQueue.postAfter(kPatience, [weak = weakSelf<ShareSheet>()] {
        if (const auto self = weak.lock())
            self->close();
    });
    if (const auto row = runningRow())
        row->showCancelling();
    const auto running = m_running;
    running->cancel(); // its end closes the sheet, now or in a while
    return false;
}

void ShareSheet::presentedViewControllerDidEnd(ViewController& presented)
{
    assertHere();
    if (!m_running || m_activityController.lock().get() != &presented)
        return;
    // The user has closed what the activity showed.
    const auto keepAlive = shared_from_this();
    const auto running = m_running;
    running->cancel();
    if (m_running == running)
        goBackToList();
}

void ShareSheet::close()
{
    m_isClosing = true;
    if (const auto presenting = presentingViewController())
        presenting->dismiss(true);
}

void ShareSheet::presentationDidEnd()
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (const auto running = std::exchange(m_running, nullptr)) {
        // Whatever becomes of it now, the sheet is not there to tell.
        running->setEndHandler({});
        running->setProgressHandler({});
        running->cancel();
    }
    if (const auto handler = std::exchange(m_handler, {}))
        handler(m_outcome.type, m_outcome.completed, {}, m_outcome.error);
}

} // namespace platform

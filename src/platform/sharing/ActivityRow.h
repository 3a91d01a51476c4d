/// A row of the share sheet: one activity and, while it is performed, how far it is and how to cancel it. Main queue only.
#pragma once

#include "platform/files/MessageCatalog.h"
#include "platform/sharing/Activity.h"
#include "platform/views/ListRow.h"
#include "platform/views/ProgressView.h"

#include <memory>
#include <optional>

namespace platform {

class ActivityRow final : public View {
public:
    /// `target` is weak, and gets the row's own parts as senders; `words` outlive it.
    ActivityRow(const MessageCatalog& words, std::shared_ptr<Activity> activity,
                const std::weak_ptr<runtime::Object>& target, const runtime::Selector& pick,
                const runtime::Selector& cancel);

    const std::shared_ptr<Activity>& activity() const { return here(m_activity); }
    const std::shared_ptr<ListRow>& row() const { return here(m_row); }
    const std::shared_ptr<Button>& cancelButton() const { return here(m_cancel); }
    const std::shared_ptr<ProgressView>& progressView() const { return here(m_progress); }

    void setEnabled(bool enabled) { here(m_row)->setEnabled(enabled); }
    void showRunning();
    void showProgress(std::optional<double> progress);
    /// It is to end; there is nothing more to cancel.
    void showCancelling();
    void showIdle();

    void layoutSubviews() override;

protected:
    void didMoveToWindow() override;

private:
    const MessageCatalog& m_words;
    std::shared_ptr<Activity> m_activity;
    std::shared_ptr<ListRow> m_row;
    std::shared_ptr<ProgressView> m_progress;
    std::shared_ptr<Button> m_cancel;
};

} // namespace platform

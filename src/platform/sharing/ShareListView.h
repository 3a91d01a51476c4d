/// The share sheet's list: a row for each activity, and a last line while more are looked for. Main queue only.
#pragma once

#include "platform/sharing/ActivityList.h"
#include "platform/sharing/ActivityRow.h"
#include "platform/views/Label.h"
#include "platform/views/ScrollView.h"

#include <memory>
#include <vector>

namespace platform {

class ShareListView final : public View {
public:
    /// `words` outlive it.
    explicit ShareListView(const MessageCatalog& words);

    /// A row for each of them, in that order; those that have one keep it, and they all stay.
    void show(const ActivityList::Activities& activities, const std::weak_ptr<runtime::Object>& target,
              const runtime::Selector& pick, const runtime::Selector& cancel);
    void setLooking(bool looking);
    bool isLooking() const { return here(m_isLooking); }
    /// From now on it would like to be so high: what comes later is scrolled to.
    void freezeHeight(double height) { here(m_frozenHeight) = height; }

    /// Whether its rows can be picked, those that come later included.
    void setEnabled(bool enabled);

    const std::vector<std::shared_ptr<ActivityRow>>& rows() const { return here(m_rows); }
    std::shared_ptr<ActivityRow> rowOf(const Activity& activity) const;
    const std::shared_ptr<ScrollView>& scrollView() const { return here(m_scroll); }
    /// "Looking for more…", or that there is nothing; hidden when neither is so.
    const std::shared_ptr<Label>& footerLabel() const { return here(m_footer); }

    double wantedHeight() const;
    void layoutSubviews() override;

protected:
    void didMoveToWindow() override;

private:
    bool hasFooter() const { return m_isLooking || m_rows.empty(); }
    double contentHeight() const;
    void showFooter();
    void layoutFooter(double y);

    const MessageCatalog& m_words;
    std::vector<std::shared_ptr<ActivityRow>> m_rows;
    std::shared_ptr<ScrollView> m_scroll = std::make_shared<ScrollView>();
    std::shared_ptr<Label> m_footer = std::make_shared<Label>();
    std::shared_ptr<ActivityIndicator> m_indicator = std::make_shared<ActivityIndicator>();
    bool m_isLooking = true;
    bool m_isEnabled = true;
    std::optional<double> m_frozenHeight;
};

} // namespace platform

#include "platform/sharing/ShareListView.h"

#include "platform/views/Window.h"

#include <algorithm>

namespace platform {

namespace {

constexpr double kMargin = 8;
constexpr double kFooterHeight = 56;
constexpr double kFooterSize = 15;
constexpr Color kFooterColor{0, 0, 0, 0.7};
/// A sheet that is still empty has room for so many rows: most of them come before it is all there.
constexpr int kExpectedRows = 5;

} // namespace

ShareListView::ShareListView(const MessageCatalog& words) : m_words(words)
{
    m_footer->setFontSize(kFooterSize);
    m_footer->setTextColor(kFooterColor);
    m_footer->setTextAlignment(TextAlignment::Leading);
    m_footer->setNumberOfLines(2);
}

void ShareListView::didMoveToWindow()
{
    if (m_scroll->superview())
        return;
    addSubview(m_scroll);
    m_scroll->contentView()->addSubview(m_footer);
    m_scroll->contentView()->addSubview(m_indicator);
}

void ShareListView::show(const ActivityList::Activities& activities, const std::weak_ptr<runtime::Object>& target,
                         const runtime::Selector& pick, const runtime::Selector& cancel)
{
    assertHere();
    std::vector<std::shared_ptr<ActivityRow>> rows;
    rows.reserve(activities.size());
    for (const auto& activity : activities) {
        auto row = rowOf(*activity);
        if (!row) {
            row = std::make_shared<ActivityRow>(m_words, activity, target, pick, cancel);
            row->setEnabled(m_isEnabled);
        }
        rows.push_back(row);
    }
    m_rows = std::move(rows);
    for (const auto& row : m_rows)
        m_scroll->contentView()->addSubview(row); // those who are there come to the front: into this order
    showFooter();
}

void ShareListView::setLooking(bool looking)
{
    assertHere();
    m_isLooking = looking;
    showFooter();
}

void ShareListView::showFooter()
{
    m_footer->setText(m_words.text(m_isLooking ? "SHARE_LOOKING" : "SHARE_NOTHING"));
    m_footer->setHidden(!hasFooter());
    m_indicator->setHidden(!m_isLooking);
    m_indicator->setAnimating(m_isLooking);
    setNeedsLayout();
}

void ShareListView::setEnabled(bool enabled)
{
    assertHere();
    m_isEnabled = enabled;
    for (const auto& row : m_rows)
        row->setEnabled(enabled);
}

std::shared_ptr<ActivityRow> ShareListView::rowOf(const Activity& activity) const
{
    assertHere();
    const auto found =
        std::find_if(m_rows.begin(), m_rows.end(), [&](const auto& row) { return row->activity().get() == &activity; });
    return found == m_rows.end() ? nullptr : *found;
}

double ShareListView::contentHeight() const
{
    return static_cast<double>(m_rows.size()) * ListRow::kHeight + (hasFooter() ? kFooterHeight : 0) + 2 * kMargin;
}

double ShareListView::wantedHeight() const
{
    assertHere();
    return m_frozenHeight.value_or(std::max(contentHeight(), kExpectedRows * ListRow::kHeight + 2 * kMargin));
}

void ShareListView::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    m_scroll->setFrame(bounds());
    m_scroll->setContentHeight(contentHeight());
    double y = kMargin;
    for (const auto& row : m_rows) {
        row->setFrame(base::Rect::make(0, y, bounds().width(), ListRow::kHeight));
        y += ListRow::kHeight;
    }
    layoutFooter(y);
}

void ShareListView::layoutFooter(double y)
{
    const double width = bounds().width();
    const auto itsWindow = window();
    const bool rightToLeft = itsWindow && itsWindow->isRightToLeft();
    const auto placed = [&](double start, double top, double length, double height) {
        return base::Rect::make(rightToLeft ? width - start - length : start, top, length, height);
    };
    const double indent = ListRow::kMargin + (ListRow::kIconSize - ActivityIndicator::kWidth) / 2;
    m_indicator->setFrame(placed(indent, y + (kFooterHeight - ActivityIndicator::kHeight) / 2,
                                 ActivityIndicator::kWidth, ActivityIndicator::kHeight));
    const double start = m_isLooking ? ListRow::kTitleStart : ListRow::kMargin;
    const double room = std::max(0.0, width - start - ListRow::kMargin);
    const double height = m_footer->heightThatFits(room);
    m_footer->setFrame(placed(start, y + (kFooterHeight - height) / 2, room, height));
}

} // namespace platform

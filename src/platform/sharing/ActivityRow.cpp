#include "platform/sharing/ActivityRow.h"

#include "platform/sharing/QuietText.h"
#include "platform/views/Window.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace platform {

namespace {

constexpr double kButtonHeight = 44;
constexpr double kButtonPadding = 16;
constexpr double kMargin = 8;
constexpr double kTitleSize = 17;
/// Of the bar, from the row's end: below the title, and clear of the next row.
constexpr double kBarLift = 12;

} // namespace

ActivityRow::ActivityRow(const MessageCatalog& words, std::shared_ptr<Activity> activity,
                         const std::weak_ptr<runtime::Object>& target, const runtime::Selector& pick,
                         const runtime::Selector& cancel)
    : m_words(words), m_activity(std::move(activity)), m_row(std::make_shared<ListRow>()),
      m_progress(std::make_shared<ProgressView>()), m_cancel(std::make_shared<Button>())
{
    const std::string title = quietText(m_activity->activityTitle());
    m_row->setTitle(title);
    m_row->setGlyph(m_activity->glyph());
    m_row->setImage(m_activity->activityImage(), Button::State::Normal);
    m_row->addTarget(target, pick, kTouchUpInside);
    m_progress->setAccessibilityLabel(title);
    m_progress->setHidden(true);
    m_cancel->setTitle(words.text("BAR_CANCEL"));
    m_cancel->addTarget(target, cancel, kTouchUpInside);
    m_cancel->setHidden(true);
}

void ActivityRow::didMoveToWindow()
{
    if (m_row->superview())
        return;
    addSubview(m_row);
    addSubview(m_progress);
    addSubview(m_cancel);
}

void ActivityRow::showRunning()
{
    assertHere();
    m_progress->setProgress(std::nullopt);
    m_progress->setHidden(false);
    m_cancel->setHidden(false);
    m_cancel->setEnabled(true);
    m_row->setBusy(true);
    setNeedsLayout();
}

void ActivityRow::showProgress(std::optional<double> progress)
{
    assertHere();
    if (!progress) {
        m_progress->setProgress(std::nullopt);
        return;
    }
    // In whole percents: that is what anybody sees or hears of it.
    const double part = std::round(std::clamp(*progress, 0.0, 1.0) * 100) / 100;
    m_progress->setProgress(part, m_words.text("WORK_PERCENT", {{"part", part}}));
}

void ActivityRow::showCancelling()
{
    assertHere();
    m_progress->setProgress(std::nullopt);
    m_cancel->setEnabled(false);
}

void ActivityRow::showIdle()
{
    assertHere();
    m_progress->setHidden(true);
    m_progress->setProgress(0); // so that nothing runs unseen
    m_cancel->setHidden(true);
    m_row->setBusy(false);
    setNeedsLayout();
}

void ActivityRow::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    const base::Size size = bounds().size;
    m_row->setFrame(bounds());
    if (m_cancel->isHidden()) {
        m_row->setTrailingInset(0);
        return;
    }
    const auto itsWindow = window();
    const bool rightToLeft = itsWindow && itsWindow->isRightToLeft();
    const double wanted = textMeasuringFor(*this).widthOf(m_cancel->title(), {kTitleSize, false}) + kButtonPadding;
    const double buttonWidth = std::clamp(wanted, kButtonHeight, size.width / 3);
    const auto placed = [&](double start, double y, double width, double height) {
        return base::Rect::make(rightToLeft ? size.width - start - width : start, y, width, height);
    };
    const double buttonStart = size.width - kMargin - buttonWidth;
    m_cancel->setFrame(placed(buttonStart, (size.height - kButtonHeight) / 2, buttonWidth, kButtonHeight));
    m_row->setTrailingInset(size.width - buttonStart + kMargin);
    m_progress->setFrame(placed(ListRow::kTitleStart, size.height - kBarLift,
                                std::max(0.0, buttonStart - kMargin - ListRow::kTitleStart), ProgressView::kHeight));
}

} // namespace platform

#include "platform/views/Toolbar.h"

#include "platform/views/Window.h"

#include <algorithm>
#include <cstddef>
#include <utility>

namespace platform {

namespace {

/// Titles of buttons stand this much below the middle of a bar that is higher than a touch target.
constexpr double kTitleLowering = 8;

bool isFlexible(const std::shared_ptr<BarButtonItem>& item)
{
    return item->kind() == BarButtonItem::Kind::FlexibleSpace;
}

bool isControl(const std::shared_ptr<View>& view)
{
    return dynamic_cast<const Control*>(view.get()) != nullptr;
}

bool isTitle(const Toolbar::Items& items, std::size_t index)
{
    return index > 0 && index + 1 < items.size() && items[index]->kind() == BarButtonItem::Kind::Custom
           && !isControl(items[index]->view()) && isFlexible(items[index - 1]) && isFlexible(items[index + 1]);
}

struct Span {
    double start = 0;
    double width = 0;
    double end() const { return start + width; }
};

/// Takes what the items are wider than `room` from the titles among them; gives the width of all.
double shrinkTitles(std::vector<Span>& spans, const std::vector<std::size_t>& titles, double room)
{
    double total = 0;
    for (const Span& span : spans)
        total += span.width;
    double ofTitles = 0;
    for (const std::size_t title : titles)
        ofTitles += spans[title].width;
    if (total <= room || ofTitles <= 0)
        return total;
    const double left = std::max(0.0, ofTitles - (total - room));
    for (const std::size_t title : titles)
        spans[title].width *= left / ofTitles;
    return total - ofTitles + left;
}

/// Moves the title to the middle of the bar, as far as its neighbours let it.
void centerTitle(std::vector<Span>& spans, const Toolbar::Items& items, std::size_t title, double barWidth)
{
    double left = Toolbar::kEndMargin;
    for (std::size_t i = 0; i < title; ++i)
        if (!isFlexible(items[i]))
            left = spans[i].end();
    double right = std::max(left, barWidth - Toolbar::kEndMargin);
    for (std::size_t i = items.size() - 1; i > title; --i)
        if (!isFlexible(items[i]))
            right = spans[i].start;
    Span& span = spans[title];
    span.start = std::max(left, std::min((barWidth - span.width) / 2, right - span.width));
}

} // namespace

const runtime::Class& Toolbar::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<Toolbar>("Toolbar", &View::classObject()).build();
    return instance;
}

const runtime::Class& Toolbar::isa() const
{
    return classObject();
}

void Toolbar::setItems(Items items, bool /*animated*/)
{
    assertHere();
    const auto isHere = [this](const std::shared_ptr<BarButtonItem>& item) {
        const auto view = item->view();
        return !view || view->superview().get() == this;
    };
    for (const auto& item : items)
        item->validate();
    // Another bar may have taken a view away since: then the same list is work to do.
    if (items == m_items && std::all_of(items.begin(), items.end(), isHere))
        return;
    const auto keepAlive = shared_from_this();
    const Items previous = std::exchange(m_items, items);
    for (const auto& item : previous)
        if (std::find(items.begin(), items.end(), item) == items.end() && item->view() && isHere(item))
            item->view()->removeFromSuperview();
    for (const auto& item : items)
        if (const auto view = item->view())
            addSubview(view);
    setNeedsLayout();
}

double Toolbar::wantedWidth(BarButtonItem& item) const
{
    if (item.isSpace())
        return item.kind() == BarButtonItem::Kind::FixedSpace ? item.width() : 0;
    const auto view = item.view();
    if (!view)
        return 0;
    double width = item.width() > 0 ? item.width() : view->sizeThatFits().width;
    for (const Shrunk& shrunk : m_shrunk)
        if (shrunk.view.lock() == view && shrunk.given == width)
            width = shrunk.wanted;
    return isControl(view) ? std::max(kTouchSize, width) : width;
}

void Toolbar::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    const double barWidth = bounds().width();
    const double room = barWidth - 2 * kEndMargin;
    std::vector<Span> spans(m_items.size());
    std::vector<std::size_t> titles;
    for (std::size_t i = 0; i < m_items.size(); ++i) {
        spans[i].width = wantedWidth(*m_items[i]);
        if (isTitle(m_items, i))
            titles.push_back(i);
    }
    const std::vector<Span> wanted = spans;
    const double total = shrinkTitles(spans, titles, room);
    const auto flexible = std::count_if(m_items.begin(), m_items.end(), isFlexible);
    const double flexibleWidth = flexible > 0 ? std::max(0.0, room - total) / static_cast<double>(flexible) : 0;
    double x = kEndMargin;
    for (std::size_t i = 0; i < m_items.size(); ++i) {
        if (isFlexible(m_items[i]))
            spans[i].width = flexibleWidth;
        spans[i].start = x;
        x = spans[i].end();
    }
    if (titles.size() == 1)
        centerTitle(spans, m_items, titles.front(), barWidth);

    const auto itsWindow = window();
    if (itsWindow && itsWindow->isRightToLeft())
        for (Span& span : spans)
            span.start = barWidth - span.end();

    m_shrunk.clear();
    for (const std::size_t title : titles)
        if (spans[title].width < wanted[title].width)
            m_shrunk.push_back({m_items[title]->view(), wanted[title].width, spans[title].width});
    std::vector<std::weak_ptr<View>> placed;
    for (std::size_t i = 0; i < m_items.size(); ++i)
        if (const auto view = m_items[i]->view()) {
            place(view, spans[i].start, spans[i].width);
            placed.push_back(view);
        }
    m_placed = std::move(placed);
}

void Toolbar::place(const std::shared_ptr<View>& view, double x, double width)
{
    const double barHeight = bounds().height();
    double height = view->sizeThatFits().height;
    double y = (barHeight - height) / 2;
    if (isControl(view)) {
        height = std::min(barHeight, std::max(kTouchSize, height));
        const auto* button = dynamic_cast<const Button*>(view.get());
        const bool showsText = button && button->glyph().empty() && !button->currentImage();
        const double lowering = showsText && barHeight > kTouchSize ? kTitleLowering : 0;
        y = std::min((barHeight - height) / 2 + lowering, barHeight - height);
    }
    const auto frame = base::Rect::make(x, y, width, height);
    const bool stoodHere = std::any_of(m_placed.begin(), m_placed.end(),
                                       [&](const std::weak_ptr<View>& each) { return each.lock() == view; });
    if (stoodHere)
        view->setFrame(frame);
    else
        withoutAnimation([&] { view->setFrame(frame); });
}

Accessibility Toolbar::accessibility() const
{
    assertHere();
    Accessibility description = View::accessibility();
    description.role = AccessibilityRole::Toolbar;
    return description;
}

} // namespace platform

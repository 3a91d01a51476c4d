// Events for who listens.
#include "linux/qt/Mirror.h"
#include "linux/qt/StageWindow.h"
#include "linux/qt/accessibility/ViewAccessible.h"

#include <QAccessible>

#include <utility>

namespace qtui {

namespace {

void tell(ViewItem& item, QAccessible::Event kind)
{
    const auto view = item.view();
    if (!QAccessible::isActive() || !view || view->accessibility().role == platform::AccessibilityRole::None)
        return;
    QAccessibleEvent event(&item, kind);
    QAccessible::updateAccessibility(&event);
}

} // namespace

Announcer::Announcer(std::function<void(QAccessibleEvent*)> tell)
    : m_tell(tell ? std::move(tell) : QAccessible::updateAccessibility)
{
}

void Announcer::announce(StageWindow& window)
{
    const auto focused = window.views().focusedView();
    const auto previous = std::exchange(m_focused, focused);
    ViewItem* item = focused ? window.mirror().itemFor(*focused) : nullptr;
    if (!item)
        return;
    const auto shown = focused->accessibility();
    const double number = std::exchange(m_number, shown.number);
    if (previous.lock() != focused) {
        QAccessibleEvent event(item, QAccessible::Focus);
        m_tell(&event);
    } else if (shown.role == platform::AccessibilityRole::Slider && number != shown.number) {
        QAccessibleValueChangeEvent event(item, shown.number);
        m_tell(&event);
    }
}

void announceCreated(ViewItem& item)
{
    tell(item, QAccessible::ObjectCreated);
}

void announceRemoved(ViewItem& item)
{
    tell(item, QAccessible::ObjectDestroyed);
}

} // namespace qtui

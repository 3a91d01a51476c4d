// Events for who listens.
#include "linux/qt/Mirror.h"
#include "linux/qt/StageWindow.h"
#include "linux/qt/accessibility/ViewAccessible.h"
#include "platform/views/Presentation.h"

#include <algorithm>
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
    m_affinity.assertHere();
    announceMessages(window);
    announceDialog(window);
    announceFocus(window);
}

void Announcer::announceDialog(StageWindow& window)
{
    const auto presentation = window.views().topPresentation();
    const std::shared_ptr<platform::View> dialog = presentation ? presentation->surface() : nullptr;
    const bool isNew = dialog && dialog != m_dialog.lock();
    m_dialog = dialog;
    ViewItem* item = isNew ? window.mirror().itemFor(*dialog) : nullptr;
    if (!item)
        return;
    tellOf(*item, QAccessible::ObjectShow);
    tellOf(*item, QAccessible::Alert);
}

void Announcer::announceMessages(StageWindow& window)
{
    std::vector<Message> now;
    for (VideoItem* item : window.mirror().messages())
        now.push_back({item, item->message()});
    const std::vector<Message> before = std::exchange(m_messages, now);
    const auto find = [](const std::vector<Message>& all, const Message& wanted) {
        return std::find_if(all.begin(), all.end(), [&](const Message& each) { return each.item == wanted.item; });
    };
    for (const Message& each : before)
        if (each.item && find(now, each) == now.end())
            tellOf(*each.item, QAccessible::ObjectHide);
    for (const Message& each : now) {
        const auto former = find(before, each);
        if (former != before.end() && former->text == each.text)
            continue;
        tellOf(*each.item, former == before.end() ? QAccessible::ObjectShow : QAccessible::NameChanged);
        tellOf(*each.item, QAccessible::Alert);
    }
}

void Announcer::tellOf(QObject& item, QAccessible::Event kind) const
{
    QAccessibleEvent event(&item, kind);
    m_tell(&event);
}

void Announcer::announceFocus(StageWindow& window)
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

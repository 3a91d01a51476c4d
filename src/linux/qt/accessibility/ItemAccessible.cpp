#include "linux/qt/accessibility/ItemAccessible.h"

#include <QQuickWindow>

namespace qtui {

bool ItemAccessible::isValid() const
{
    return m_item.window() != nullptr;
}

QObject* ItemAccessible::object() const
{
    return &m_item;
}

QWindow* ItemAccessible::window() const
{
    return m_item.window();
}

QAccessibleInterface* ItemAccessible::parent() const
{
    return QAccessible::queryAccessibleInterface(window());
}

QRect ItemAccessible::rect() const
{
    const QRect inWindow = m_item.windowRect().toAlignedRect();
    return window() ? QRect(window()->mapToGlobal(inWindow.topLeft()), inWindow.size()) : inWindow;
}

} // namespace qtui

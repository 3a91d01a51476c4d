#include "linux/qt/accessibility/ItemAccessible.h"

#include <QQuickWindow>

namespace qtui {

bool ItemAccessible::isValid() const
{
    m_affinity.assertHere();
    return m_item.window() != nullptr;
}

QObject* ItemAccessible::object() const
{
    m_affinity.assertHere();
    return &m_item;
}

QWindow* ItemAccessible::window() const
{
    m_affinity.assertHere();
    return m_item.window();
}

QAccessibleInterface* ItemAccessible::parent() const
{
    m_affinity.assertHere();
    return QAccessible::queryAccessibleInterface(window());
}

QRect ItemAccessible::rect() const
{
    m_affinity.assertHere();
    const QRect inWindow = m_item.windowRect().toAlignedRect();
    return window() ? QRect(window()->mapToGlobal(inWindow.topLeft()), inWindow.size()) : inWindow;
}

} // namespace qtui

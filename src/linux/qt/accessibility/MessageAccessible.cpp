#include "linux/qt/accessibility/MessageAccessible.h"

#include "linux/qt/StageWindow.h"
#include "linux/qt/items/VideoItem.h"

#include <QAccessible>

namespace qtui {

namespace {

class MessageAccessible final : public QAccessibleInterface {
public:
    explicit MessageAccessible(VideoItem& item) : m_item(item) {}

    bool isValid() const override { return m_item.window() != nullptr; }
    QObject* object() const override { return &m_item; }
    QWindow* window() const override { return m_item.window(); }
    QAccessibleInterface* parent() const override { return QAccessible::queryAccessibleInterface(window()); }
    QAccessibleInterface* child(int /*index*/) const override { return nullptr; }
    int childCount() const override { return 0; }
    int indexOfChild(const QAccessibleInterface* /*child*/) const override { return -1; }
    QAccessibleInterface* childAt(int /*x*/, int /*y*/) const override { return nullptr; }
    QRect rect() const override
    {
        const QRect inWindow = m_item.windowRect().toAlignedRect();
        return window() ? QRect(window()->mapToGlobal(inWindow.topLeft()), inWindow.size()) : inWindow;
    }
    QString text(QAccessible::Text kind) const override
    {
        return kind == QAccessible::Name ? m_item.message() : QString();
    }
    void setText(QAccessible::Text /*kind*/, const QString& /*text*/) override {}
    QAccessible::Role role() const override { return QAccessible::AlertMessage; }
    QAccessible::State state() const override
    {
        QAccessible::State state;
        state.invisible = m_item.message().isEmpty();
        state.readOnly = true;
        return state;
    }

private:
    VideoItem& m_item;
};

} // namespace

QAccessibleInterface* makeMessageAccessible(VideoItem& item)
{
    return new MessageAccessible(item);
}

} // namespace qtui

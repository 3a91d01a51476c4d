#include "linux/qt/accessibility/MessageAccessible.h"

#include "linux/qt/accessibility/ItemAccessible.h"
#include "linux/qt/items/VideoItem.h"

namespace qtui {

namespace {

class MessageAccessible final : public ItemAccessible {
public:
    explicit MessageAccessible(VideoItem& item) : ItemAccessible(item), m_item(item) {}

    QString text(QAccessible::Text kind) const override
    {
        return kind == QAccessible::Name ? m_item.message() : QString();
    }
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

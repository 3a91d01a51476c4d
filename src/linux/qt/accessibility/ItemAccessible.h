/// What assistive technology sees of an item that is a part of its window, and has none itself: where it is, and to whom
/// it belongs. GUI thread; Qt's factory owns it, and the item outlives it.
#pragma once

#include "base/Affinity.h"
#include "linux/qt/items/ViewItem.h"

#include <QAccessibleInterface>

namespace qtui {

class ItemAccessible : public QAccessibleInterface {
public:
    bool isValid() const override;
    QObject* object() const override;
    QWindow* window() const override;
    QAccessibleInterface* parent() const override;
    QAccessibleInterface* child(int /*index*/) const override { return nullptr; }
    int childCount() const override { return 0; }
    int indexOfChild(const QAccessibleInterface* /*child*/) const override { return -1; }
    QAccessibleInterface* childAt(int /*x*/, int /*y*/) const override { return nullptr; }
    QRect rect() const override;
    void setText(QAccessible::Text /*kind*/, const QString& /*text*/) override {}

protected:
    explicit ItemAccessible(PeerItem& item) : m_item(item) {}

private:
    base::Affinity m_affinity;
    PeerItem& m_item;
};

} // namespace qtui

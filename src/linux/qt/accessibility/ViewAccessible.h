/// What assistive technology sees of a window: the views that have a role, with what can be done to them. GUI thread.
///
/// The tree is asked for live from the views; an interface lives as long as the view's item.
#pragma once

#include "base/Affinity.h"
#include "platform/views/View.h"

#include <QAccessible>
#include <QPointer>
#include <QQuickItem>
#include <QString>

#include <functional>
#include <memory>
#include <vector>

namespace qtui {

class StageWindow;
class ViewItem;

/// Makes Qt answer for stage windows and view items. Any number of times.
void installAccessibility();

/// The views below `view` that can be seen and have a role; views without one give way to what is below them.
std::vector<std::shared_ptr<platform::View>> accessibleChildren(const platform::View& view);

/// Tells who listens what a commit has changed.
class Announcer {
public:
    /// `tell` hands an event to who listens; Qt does that unless a test wants to know.
    explicit Announcer(std::function<void(QAccessibleEvent*)> tell = {});

    void announce(StageWindow& window);

private:
    struct Message {
        QPointer<QQuickItem> item;
        QString text;
    };

    void announceFocus(StageWindow& window);
    void announceDialog(StageWindow& window);
    void announceMessages(StageWindow& window);
    void tellOf(QObject& item, QAccessible::Event kind) const;

    base::Affinity m_affinity;
    std::function<void(QAccessibleEvent*)> m_tell;
    std::weak_ptr<platform::View> m_focused;
    double m_number = 0; ///< of the focused view, where it has one
    std::vector<Message> m_messages;
    std::weak_ptr<platform::View> m_dialog; ///< the topmost one
};

/// Tell who listens that an item has come, or is about to go. Nothing when nobody listens.
void announceCreated(ViewItem& item);
void announceRemoved(ViewItem& item);

} // namespace qtui

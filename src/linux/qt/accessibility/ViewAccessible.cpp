#include "linux/qt/accessibility/ViewAccessible.h"

#include "linux/qt/Mirror.h"
#include "linux/qt/StageWindow.h"
#include "linux/qt/accessibility/MessageAccessible.h"
#include "linux/qt/accessibility/WorkAccessible.h"
#include "linux/qt/items/WorkLine.h"
#include "platform/views/Presentation.h"

#include <QAccessible>
#include <QAccessibleActionInterface>
#include <QAccessibleValueInterface>

#include <algorithm>

namespace qtui {

namespace {

using platform::AccessibilityRole;
using platform::View;

QAccessible::Role toQt(AccessibilityRole role)
{
    switch (role) {
    case AccessibilityRole::Button:
        return QAccessible::Button;
    case AccessibilityRole::Label:
        return QAccessible::StaticText;
    case AccessibilityRole::Image:
        return QAccessible::Graphic;
    case AccessibilityRole::Toolbar:
        return QAccessible::ToolBar;
    case AccessibilityRole::Slider:
        return QAccessible::Slider;
    case AccessibilityRole::Video:
        return QAccessible::Animation;
    case AccessibilityRole::Progress:
        return QAccessible::ProgressBar;
    case AccessibilityRole::Dialog:
        return QAccessible::Dialog;
    case AccessibilityRole::Group:
    case AccessibilityRole::None:
        break;
    }
    return QAccessible::Grouping;
}

QAccessibleInterface* interfaceFor(const StageWindow& window, const View& view)
{
    ViewItem* item = window.mirror().itemFor(view);
    return item ? QAccessible::queryAccessibleInterface(item) : nullptr;
}

int indexOf(const QAccessibleInterface& parent, const QAccessibleInterface* child)
{
    for (int i = 0; i < parent.childCount(); ++i)
        if (parent.child(i) == child)
            return i;
    return -1;
}

QAccessibleInterface* deepestAt(const QAccessibleInterface& parent, int x, int y)
{
    // The last one that was drawn is in front.
    for (int i = parent.childCount() - 1; i >= 0; --i) {
        QAccessibleInterface* child = parent.child(i);
        if (!child || !child->rect().contains(x, y))
            continue;
        QAccessibleInterface* below = child->childAt(x, y);
        return below ? below : child;
    }
    return nullptr;
}

/// One view. Its item may outlive it by a moment: then it is not valid and says nothing.
class ViewAccessible final : public QAccessibleInterface,
                             public QAccessibleActionInterface,
                             public QAccessibleValueInterface {
public:
    explicit ViewAccessible(ViewItem& item) : m_item(item) {}

    bool isValid() const override { return view() && stage(); }
    QObject* object() const override { return &m_item; }
    QWindow* window() const override { return m_item.window(); }

    QAccessibleInterface* parent() const override
    {
        const StageWindow* itsStage = stage();
        if (!itsStage || !view())
            return nullptr;
        for (auto above = view()->superview(); above; above = above->superview())
            if (above->accessibility().role != AccessibilityRole::None)
                return interfaceFor(*itsStage, *above);
        return itsStage->accessibleRoot();
    }
    QAccessibleInterface* child(int index) const override
    {
        const auto below = children();
        if (!stage() || index < 0 || index >= static_cast<int>(below.size()))
            return nullptr;
        return interfaceFor(*stage(), *below[static_cast<std::size_t>(index)]);
    }
    int childCount() const override { return static_cast<int>(children().size()); }
    int indexOfChild(const QAccessibleInterface* child) const override { return indexOf(*this, child); }
    QAccessibleInterface* childAt(int x, int y) const override { return deepestAt(*this, x, y); }
    QRect rect() const override
    {
        const QRect inWindow = m_item.windowRect().toAlignedRect();
        return window() ? QRect(window()->mapToGlobal(inWindow.topLeft()), inWindow.size()) : inWindow;
    }

    QString text(QAccessible::Text kind) const override
    {
        const auto shown = description();
        if (kind == QAccessible::Name)
            return QString::fromStdString(shown.name);
        // A label says its text as its name already.
        if (kind == QAccessible::Value && shown.role != AccessibilityRole::Label)
            return QString::fromStdString(shown.value);
        return {};
    }
    void setText(QAccessible::Text, const QString&) override {}
    QAccessible::Role role() const override { return toQt(description().role); }
    QAccessible::State state() const override
    {
        QAccessible::State state;
        if (!isValid()) {
            state.invalid = true;
            return state;
        }
        const auto shown = description();
        state.disabled = !shown.enabled;
        state.focusable = view()->canBecomeFocused();
        state.focused = stage()->views().focusedView() == view();
        state.readOnly = shown.role == AccessibilityRole::Label || shown.role == AccessibilityRole::Progress;
        state.busy = shown.role == AccessibilityRole::Progress;
        state.modal = shown.role == AccessibilityRole::Dialog;
        return state;
    }

    void* interface_cast(QAccessible::InterfaceType type) override
    {
        if (type == QAccessible::ActionInterface && !actionNames().isEmpty())
            return static_cast<QAccessibleActionInterface*>(this);
        const auto role = description().role;
        if (type == QAccessible::ValueInterface
            && (role == AccessibilityRole::Slider || role == AccessibilityRole::Progress))
            return static_cast<QAccessibleValueInterface*>(this);
        return nullptr;
    }

    QStringList actionNames() const override
    {
        QStringList names;
        const auto shown = description();
        if (!isValid() || !shown.enabled)
            return names;
        if (shown.role == AccessibilityRole::Button)
            names << pressAction();
        if (shown.role == AccessibilityRole::Slider)
            names << increaseAction() << decreaseAction();
        if (view()->canBecomeFocused())
            names << setFocusAction();
        return names;
    }
    void doAction(const QString& name) override
    {
        if (!actionNames().contains(name))
            return;
        const auto shown = description();
        if (name == pressAction())
            view()->activate();
        else if (name == increaseAction())
            setNumber(shown.number + shown.step);
        else if (name == decreaseAction())
            setNumber(shown.number - shown.step);
        else
            takeFocus();
    }
    QStringList keyBindingsForAction(const QString&) const override { return {}; }

    QVariant currentValue() const override { return description().number; }
    void setCurrentValue(const QVariant& value) override { setNumber(value.toDouble()); }
    QVariant maximumValue() const override { return description().maximum; }
    QVariant minimumValue() const override { return description().minimum; }
    QVariant minimumStepSize() const override { return description().step; }

private:
    std::shared_ptr<View> view() const { return m_item.view(); }
    const StageWindow* stage() const { return dynamic_cast<const StageWindow*>(m_item.window()); }
    platform::Accessibility description() const { return view() ? view()->accessibility() : platform::Accessibility(); }
    std::vector<std::shared_ptr<View>> children() const
    {
        return view() ? accessibleChildren(*view()) : std::vector<std::shared_ptr<View>>();
    }

    void setNumber(double number)
    {
        const auto shown = description();
        if (shown.role == AccessibilityRole::Slider && shown.enabled)
            view()->setNumber(std::clamp(number, shown.minimum, std::max(shown.minimum, shown.maximum)));
    }

    /// The focus goes round until it comes here, or back to where it began.
    void takeFocus()
    {
        const auto wanted = view();
        platform::Window& views = stage()->views();
        std::shared_ptr<View> first;
        while (views.focusedView() != wanted) {
            views.moveFocus(true);
            const auto now = views.focusedView();
            if (!now || now == first)
                return;
            if (!first)
                first = now;
        }
    }

    ViewItem& m_item;
};

class WindowAccessible final : public QAccessibleInterface {
public:
    explicit WindowAccessible(StageWindow& window) : m_window(window) {}

    bool isValid() const override { return true; }
    QObject* object() const override { return &m_window; }
    QWindow* window() const override { return &m_window; }
    QAccessibleInterface* parent() const override { return QAccessible::queryAccessibleInterface(qApp); }
    QAccessibleInterface* child(int index) const override
    {
        if (index < 0)
            return nullptr;
        auto at = static_cast<std::size_t>(index);
        const auto messages = saidByVideos();
        if (at < messages.size())
            return QAccessible::queryAccessibleInterface(messages[at]);
        at -= messages.size();
        const auto below = shownViews();
        if (at < below.size())
            return interfaceFor(m_window, *below[at]);
        return at == below.size() && m_window.workLine().isUnderWay()
                   ? QAccessible::queryAccessibleInterface(&m_window.workLine())
                   : nullptr;
    }
    /// First comes what videos say, which are drawn behind the views; last what is under way, if anything is.
    int childCount() const override
    {
        return static_cast<int>(saidByVideos().size() + shownViews().size()) + m_window.workLine().isUnderWay();
    }
    int indexOfChild(const QAccessibleInterface* child) const override { return indexOf(*this, child); }
    QAccessibleInterface* childAt(int x, int y) const override { return deepestAt(*this, x, y); }
    QAccessibleInterface* focusChild() const override
    {
        const auto focused = m_window.views().focusedView();
        return focused ? interfaceFor(m_window, *focused) : nullptr;
    }
    QRect rect() const override { return {m_window.position(), m_window.size()}; }
    QString text(QAccessible::Text kind) const override
    {
        return kind == QAccessible::Name ? m_window.title() : QString();
    }
    void setText(QAccessible::Text, const QString&) override {}
    QAccessible::Role role() const override { return QAccessible::Window; }
    QAccessible::State state() const override
    {
        QAccessible::State state;
        state.active = m_window.isActive();
        state.invisible = !m_window.isVisible();
        return state;
    }

private:
    /// While something is presented, what is behind it is out of reach, and so it is not there.
    std::vector<std::shared_ptr<View>> shownViews() const
    {
        const auto presentation = m_window.views().topPresentation();
        return accessibleChildren(presentation ? *presentation : static_cast<const View&>(m_window.views()));
    }
    std::vector<VideoItem*> saidByVideos() const
    {
        return m_window.views().topPresentation() ? std::vector<VideoItem*>() : m_window.mirror().messages();
    }

    StageWindow& m_window;
};

QAccessibleInterface* makeInterface(const QString&, QObject* object)
{
    if (auto* window = dynamic_cast<StageWindow*>(object))
        return new WindowAccessible(*window);
    if (auto* item = dynamic_cast<ViewItem*>(object))
        return new ViewAccessible(*item);
    if (auto* video = dynamic_cast<VideoItem*>(object))
        return makeMessageAccessible(*video);
    if (auto* line = dynamic_cast<WorkLine*>(object))
        return makeWorkAccessible(*line);
    return nullptr;
}

} // namespace

void installAccessibility()
{
    QAccessible::installFactory(makeInterface);
}

std::vector<std::shared_ptr<View>> accessibleChildren(const View& view)
{
    std::vector<std::shared_ptr<View>> found;
    for (const auto& below : view.subviews()) {
        if (below->isHidden() || below->alpha() <= 0)
            continue;
        if (below->accessibility().role != AccessibilityRole::None) {
            found.push_back(below);
            continue;
        }
        const auto deeper = accessibleChildren(*below);
        found.insert(found.end(), deeper.begin(), deeper.end());
    }
    return found;
}

} // namespace qtui

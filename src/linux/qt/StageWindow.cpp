#include "linux/qt/StageWindow.h"

#include "linux/qt/Presenter.h"
#include "linux/qt/accessibility/ViewAccessible.h"

#include <QAccessible>
#include <QCloseEvent>

namespace qtui {

StageWindow::StageWindow(Presenter& presenter, platform::Window& views, const base::Clock& clock)
    : m_presenter(presenter), m_views(views), m_input(views, clock), m_root([&presenter] { presenter.frameDue(); })
{
    installAccessibility();
    setColor(Qt::black);
    const base::Size size = views.bounds().size;
    resize(static_cast<int>(size.width), static_cast<int>(size.height));
    m_root.setParentItem(contentItem());
    QObject::connect(this, &QWindow::screenChanged, &m_root, [this] { m_presenter.takeScale(); });
}

StageWindow::~StageWindow()
{
    m_affinity.assertHere();
    m_root.setParentItem(nullptr);
}

const Mirror& StageWindow::mirror() const
{
    m_affinity.assertHere();
    return m_presenter.mirror();
}

WorkLine& StageWindow::workLine() const
{
    m_affinity.assertHere();
    return m_presenter.workLine();
}

QAccessibleInterface* StageWindow::accessibleRoot() const
{
    m_affinity.assertHere();
    return QAccessible::queryAccessibleInterface(const_cast<StageWindow*>(this));
}

bool StageWindow::event(QEvent* event)
{
    if (m_input.handle(*event))
        return true;
    switch (event->type()) {
    case QEvent::Close:
        if (m_presenter.closeRequested()) {
            static_cast<QCloseEvent*>(event)->ignore();
            return true;
        }
        break;
    case QEvent::Hide:
        m_input.cancelTouches();
        break;
    case QEvent::Expose:
        m_presenter.takeScale();
        break;
    case QEvent::ThemeChange:
    case QEvent::ApplicationPaletteChange:
        m_presenter.takeSystemScheme();
        break;
    default:
        break;
    }
    return QQuickWindow::event(event);
}

void StageWindow::resizeEvent(QResizeEvent* event)
{
    QQuickWindow::resizeEvent(event);
    m_presenter.takeScale();
    if (event->size().isEmpty())
        return;
    m_views.requestSize({static_cast<double>(event->size().width()), static_cast<double>(event->size().height())});
}

} // namespace qtui

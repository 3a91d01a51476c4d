#include "linux/qt/Presenter.h"

#include "linux/qt/Mirror.h"
#include "linux/qt/StageWindow.h"
#include "linux/qt/accessibility/ViewAccessible.h"
#include "linux/qt/accessibility/WorkAccessible.h"
#include "linux/qt/items/Text.h"
#include "linux/qt/items/WorkLine.h"

#include <QGuiApplication>

#include <utility>

namespace qtui {

Presenter::Presenter(std::shared_ptr<platform::Window> window, const base::Clock& clock,
                     const platform::MessageCatalog& words)
    : m_window(std::move(window)), m_clock(clock), m_stage(std::make_unique<Stage>(words))
{
    if (!hasFonts())
        qWarning("There is no font on this system: every letter will be an empty box");
    m_stage->theme = Theme::forScheme(systemScheme());
    m_quickWindow = std::make_unique<StageWindow>(*this, *m_window, m_clock);
    m_quickWindow->input().setCloseHandler([this] { closeRequested(); });
    m_mirror = std::make_unique<Mirror>(*m_window, m_quickWindow->root(), *m_stage, m_clock);
    m_announcer = std::make_unique<Announcer>();
    m_workLine = std::make_unique<WorkLine>(*m_stage);
    m_workLine->setParentItem(&m_quickWindow->root());
    m_window->setTextMeasuring(&m_measuring);
    m_window->setNeedsCommitHandler([this] {
        m_needsCommit = true;
        scheduleFrame();
    });
    takeScale();
    watchPictures();
    scheduleFrame();
}

Presenter::~Presenter()
{
    m_affinity.assertHere();
    m_window->setNeedsCommitHandler({});
    m_window->setTextMeasuring(nullptr);
    m_quickWindow->hide();
    // The items go before the window that they are in.
    m_workLine.reset();
    m_mirror.reset();
}

void Presenter::setTitle(const std::string& title)
{
    m_affinity.assertHere();
    m_quickWindow->setTitle(QString::fromStdString(title));
}

void Presenter::setCloseHandler(std::function<void()> handler)
{
    m_affinity.assertHere();
    m_closeHandler = std::move(handler);
}

void Presenter::setFirstPictureHandler(std::function<void()> handler)
{
    m_affinity.assertHere();
    m_firstPictureHandler = std::move(handler);
}

void Presenter::setScheme(Scheme scheme)
{
    m_affinity.assertHere();
    m_schemeIsFixed = true;
    if (std::exchange(m_stage->theme, Theme::forScheme(scheme)).scheme != scheme)
        redrawAll();
}

Scheme Presenter::scheme() const
{
    m_affinity.assertHere();
    return m_stage->theme.scheme;
}

void Presenter::setLiveBlur(bool live)
{
    m_affinity.assertHere();
    if (std::exchange(m_stage->liveBlur, live) != live)
        redrawAll();
}

void Presenter::show()
{
    m_affinity.assertHere();
    m_quickWindow->show();
    m_window->setVisible(true);
}

void Presenter::showFullScreen()
{
    m_affinity.assertHere();
    m_quickWindow->showFullScreen();
    m_window->setVisible(true);
}

void Presenter::hide()
{
    m_affinity.assertHere();
    m_quickWindow->hide();
    m_window->setVisible(false);
}

void Presenter::showWork(std::optional<double> progress)
{
    m_affinity.assertHere();
    const bool begins = !m_workLine->isUnderWay();
    const auto told = m_workLine->percent();
    m_workLine->begin(progress);
    if (begins)
        announceWorkBegun(*m_workLine);
    else if (m_workLine->percent() != told)
        announceWorkProgress(*m_workLine);
    m_needsCommit = true;
    scheduleFrame();
}

void Presenter::hideWork()
{
    m_affinity.assertHere();
    if (!m_workLine->isUnderWay())
        return;
    m_workLine->end();
    announceWorkEnded(*m_workLine);
    m_needsCommit = true;
    scheduleFrame();
}

void Presenter::commit()
{
    m_affinity.assertHere();
    takeScale();
    if (m_needsCommit || m_animating)
        mirrorTree();
}

QImage Presenter::grab()
{
    m_affinity.assertHere();
    commit();
    QImage image = m_quickWindow->grabWindow();
    image.setDevicePixelRatio(1);
    return image;
}

QQuickWindow& Presenter::quickWindow()
{
    m_affinity.assertHere();
    return *m_quickWindow;
}

const Statistics& Presenter::statistics() const
{
    m_affinity.assertHere();
    return m_stage->statistics;
}

const Mirror& Presenter::mirror() const
{
    m_affinity.assertHere();
    return *m_mirror;
}

void Presenter::frameDue()
{
    if (!m_needsCommit && !m_animating)
        return;
    mirrorTree();
    // Asked for from the event loop, as asking from here would not wait for the next picture.
    if (m_animating)
        QMetaObject::invokeMethod(
            &m_quickWindow->root(), [this] { scheduleFrame(); }, Qt::QueuedConnection);
}

void Presenter::mirrorTree()
{
    m_needsCommit = false;
    m_window->commit();
    m_animating = m_mirror->commit();
    m_quickWindow->root().setSize(m_quickWindow->contentItem()->size());
    m_workLine->showIn(QRectF(QPointF(), m_quickWindow->root().size()));
    m_announcer->announce(*m_quickWindow);
}

void Presenter::scheduleFrame()
{
    m_quickWindow->root().polish();
}

void Presenter::takeScale()
{
    const double scale = m_quickWindow->effectiveDevicePixelRatio();
    if (std::exchange(m_stage->scale, scale) != scale)
        redrawAll();
    m_window->setScale(scale);
}

void Presenter::takeSystemScheme()
{
    const Scheme scheme = systemScheme();
    if (m_schemeIsFixed || scheme == m_stage->theme.scheme)
        return;
    m_stage->theme = Theme::forScheme(scheme);
    redrawAll();
}

void Presenter::redrawAll()
{
    ++m_stage->generation;
    m_needsCommit = true;
    scheduleFrame();
}

bool Presenter::closeRequested()
{
    if (!m_closeHandler)
        return false;
    // Not from inside the event: the handler may end the window that is being asked.
    QMetaObject::invokeMethod(
        m_quickWindow.get(),
        [this] {
            const auto handler = m_closeHandler; // may replace itself, or end us
            if (handler)
                handler();
        },
        Qt::QueuedConnection);
    return true;
}

void Presenter::watchPictures()
{
    // Both run on the render thread; the first while the GUI thread stands still.
    struct Watch {
        bool inThisFrame = false;
        bool told = false;
    };
    const auto watch = std::make_shared<Watch>();
    QObject::connect(
        m_quickWindow.get(), &QQuickWindow::beforeSynchronizing, m_quickWindow.get(),
        [this, watch] { watch->inThisFrame = m_mirror && m_mirror->showsVideo(); }, Qt::DirectConnection);
    QObject::connect(
        m_quickWindow.get(), &QQuickWindow::frameSwapped, m_quickWindow.get(),
        [this, watch] {
            if (!watch->inThisFrame || std::exchange(watch->told, true))
                return;
            QMetaObject::invokeMethod(
                m_quickWindow.get(),
                [this] {
                    if (const auto handler = std::exchange(m_firstPictureHandler, {}))
                        handler();
                },
                Qt::QueuedConnection);
        },
        Qt::DirectConnection);
}

} // namespace qtui

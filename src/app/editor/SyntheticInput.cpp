#include "app/editor/SyntheticInput.h"

#include <QCoreApplication>
#include <QKeyEvent>
#include <QPointingDevice>
#include <QQuickWindow>
#include <QTouchEvent>

#include <map>

namespace app {

namespace {

const QPointingDevice* finger()
{
    // The application's: what outlives it would look for a list of devices that is gone.
    static const auto* const device =
        new QPointingDevice("Script", 1, QInputDevice::DeviceType::TouchScreen, QPointingDevice::PointerType::Finger,
                            QInputDevice::Capability::Position, 1, 0, {}, {}, QCoreApplication::instance());
    return device;
}

void touch(QQuickWindow& window, QEvent::Type type, QEventPoint::State state, base::Point at)
{
    const QPointF point(at.x, at.y);
    QTouchEvent event(type, finger(), Qt::NoModifier, {QEventPoint(0, state, point, point)});
    QCoreApplication::sendEvent(&window, &event);
}

} // namespace

void SyntheticInput::press(base::Point at)
{
    m_affinity.assertHere();
    touch(m_window, QEvent::TouchBegin, QEventPoint::Pressed, at);
}

void SyntheticInput::move(base::Point to)
{
    m_affinity.assertHere();
    touch(m_window, QEvent::TouchUpdate, QEventPoint::Updated, to);
}

void SyntheticInput::release(base::Point at)
{
    m_affinity.assertHere();
    touch(m_window, QEvent::TouchEnd, QEventPoint::Released, at);
}

bool SyntheticInput::key(const std::string& name)
{
    m_affinity.assertHere();
    static const std::map<std::string, int> kKeys{
        {"space", Qt::Key_Space}, {"escape", Qt::Key_Escape}, {"return", Qt::Key_Return}, {"left", Qt::Key_Left},
        {"right", Qt::Key_Right}, {"home", Qt::Key_Home},     {"end", Qt::Key_End},       {"tab", Qt::Key_Tab},
        {"comma", Qt::Key_Comma}, {"period", Qt::Key_Period}, {"undo", Qt::Key_Z},        {"i", Qt::Key_I},
        {"o", Qt::Key_O},
    };
    const auto found = kKeys.find(name);
    if (found == kKeys.end())
        return false;
    const Qt::KeyboardModifiers modifiers = name == "undo" ? Qt::ControlModifier : Qt::NoModifier;
    const QString text = name == "space" ? " " : name == "comma" ? "," : name == "period" ? "." : QString();
    for (const QEvent::Type type : {QEvent::KeyPress, QEvent::KeyRelease}) {
        QKeyEvent event(type, found->second, modifiers, text);
        QCoreApplication::sendEvent(&m_window, &event);
    }
    return true;
}

} // namespace app

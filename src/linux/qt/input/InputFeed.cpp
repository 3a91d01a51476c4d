#include "linux/qt/input/InputFeed.h"

#include <QKeyEvent>
#include <QMouseEvent>
#include <QTouchEvent>
#include <QWheelEvent>

#include <optional>
#include <utility>

namespace qtui {

namespace {

base::Point toPoint(QPointF point)
{
    return {point.x(), point.y()};
}

std::optional<platform::Key> meaningOf(int key)
{
    using platform::Key;
    switch (key) {
    case Qt::Key_Space:
    case Qt::Key_MediaPlay:
    case Qt::Key_MediaPause:
    case Qt::Key_MediaTogglePlayPause:
        return Key::Space;
    case Qt::Key_Escape:
    case Qt::Key_Back: // of phones
        return Key::Escape;
    case Qt::Key_Return:
    case Qt::Key_Enter:
        return Key::Return;
    case Qt::Key_Left:
        return Key::Left;
    case Qt::Key_Right:
        return Key::Right;
    case Qt::Key_Up:
        return Key::Up;
    case Qt::Key_Down:
        return Key::Down;
    case Qt::Key_Home:
        return Key::Home;
    case Qt::Key_End:
        return Key::End;
    case Qt::Key_Comma:
        return Key::Comma;
    case Qt::Key_Period:
        return Key::Period;
    default:
        return std::nullopt;
    }
}

/// Keys that are worth repeating while they are held: those that move something.
bool repeats(platform::Key key)
{
    using platform::Key;
    return key == Key::Left || key == Key::Right || key == Key::Up || key == Key::Down || key == Key::Comma
           || key == Key::Period;
}

} // namespace

bool InputFeed::handle(QEvent& event)
{
    m_affinity.assertHere();
    switch (event.type()) {
    case QEvent::TouchBegin:
    case QEvent::TouchUpdate:
    case QEvent::TouchEnd:
        touch(static_cast<const QTouchEvent&>(event));
        event.accept();
        return true;
    case QEvent::TouchCancel:
        cancelTouches();
        event.accept();
        return true;
    case QEvent::MouseButtonPress:
    case QEvent::MouseButtonDblClick: // stands for the press of the second click
    case QEvent::MouseMove:
    case QEvent::MouseButtonRelease:
        mouse(static_cast<const QMouseEvent&>(event));
        event.accept();
        return true;
    case QEvent::Wheel:
        wheel(static_cast<const QWheelEvent&>(event));
        event.accept();
        return true;
    case QEvent::KeyPress:
        event.setAccepted(key(static_cast<const QKeyEvent&>(event)));
        return true;
    default:
        return false;
    }
}

void InputFeed::cancelTouches()
{
    m_affinity.assertHere();
    for (const int id : std::exchange(m_touches, {}))
        m_window.touchCancel({id, {}, m_clock.now()});
}

void InputFeed::touch(const QTouchEvent& event)
{
    for (const QEventPoint& point : event.points()) {
        // From the window system, the scene's position is the screen's: wrong by where the window stands. What the
        // program makes itself has no other.
        const base::Point position = toPoint(event.spontaneous() ? point.position() : point.scenePosition());
        switch (point.state()) {
        case QEventPoint::Pressed:
            down(point.id(), position);
            break;
        case QEventPoint::Updated:
            move(point.id(), position);
            break;
        case QEventPoint::Released:
            up(point.id(), position);
            break;
        default:
            break;
        }
    }
}

void InputFeed::mouse(const QMouseEvent& event)
{
    if (event.source() != Qt::MouseEventNotSynthesized)
        return;
    const base::Point position = toPoint(event.position());
    if (event.type() == QEvent::MouseMove)
        move(kMouse, position);
    else if (event.button() != Qt::LeftButton)
        return;
    else if (event.type() == QEvent::MouseButtonRelease)
        up(kMouse, position);
    else
        down(kMouse, position);
}

void InputFeed::wheel(const QWheelEvent& event)
{
    // Touchpads say how far in pixels; a wheel's notch is 120, and moves about three lines of text.
    constexpr double kPointsPerNotch = 56;
    const double points =
        event.pixelDelta().isNull() ? event.angleDelta().y() / 120.0 * kPointsPerNotch : event.pixelDelta().y();
    if (points != 0)
        m_window.scroll(toPoint(event.position()), points);
}

void InputFeed::down(int id, base::Point position)
{
    m_touches.insert(id);
    // The ring is for who steers by keys.
    m_window.clearFocus();
    m_window.touchDown({id, position, m_clock.now()});
}

void InputFeed::move(int id, base::Point position)
{
    if (m_touches.count(id) > 0)
        m_window.touchMove({id, position, m_clock.now()});
}

void InputFeed::up(int id, base::Point position)
{
    if (m_touches.erase(id) > 0)
        m_window.touchUp({id, position, m_clock.now()});
}

bool InputFeed::key(const QKeyEvent& event)
{
    const Qt::KeyboardModifiers modifiers = event.modifiers() & ~Qt::KeypadModifier;
    const bool control = modifiers.testFlag(Qt::ControlModifier);
    const bool shift = modifiers.testFlag(Qt::ShiftModifier);
    if (modifiers & (Qt::AltModifier | Qt::MetaModifier))
        return false;
    if (event.key() == Qt::Key_Tab || event.key() == Qt::Key_Backtab) {
        m_window.moveFocus(event.key() == Qt::Key_Tab && !shift);
        return true;
    }
    if (const auto meaning = meaningOf(event.key())) {
        if (event.isAutoRepeat() && !repeats(*meaning))
            return true;
        return m_window.keyDown(*meaning, 0, control, shift);
    }
    if (event.key() < Qt::Key_A || event.key() > Qt::Key_Z || event.isAutoRepeat())
        return false;
    const char letter = static_cast<char>('a' + (event.key() - Qt::Key_A));
    if (control && letter == 'z') {
        m_window.motion(platform::MotionSubtype::Shake);
        return true;
    }
    if (m_window.keyDown(platform::Key::Character, letter, control, shift))
        return true;
    if (control && (letter == 'w' || letter == 'q') && m_close) {
        const auto close = m_close; // may end us
        close();
        return true;
    }
    return false;
}

} // namespace qtui

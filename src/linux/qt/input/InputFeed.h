/// Turns what the window system reports into what a window of views understands. GUI thread.
///
/// A finger is a touch, and so is the mouse with its left button down; events that a platform makes up from touches are
/// dropped, so nothing arrives twice.
#pragma once

#include "base/Affinity.h"
#include "base/Clock.h"
#include "platform/views/Window.h"

#include <functional>
#include <set>

class QEvent;
class QKeyEvent;
class QMouseEvent;
class QTouchEvent;
class QWheelEvent;

namespace qtui {

class InputFeed {
public:
    /// The touch that the mouse is.
    static constexpr int kMouse = -1;

    InputFeed(platform::Window& window, const base::Clock& clock) : m_window(window), m_clock(clock) {}

    /// What closing the window by keys does: Ctrl+W, Ctrl+Q.
    void setCloseHandler(std::function<void()> handler)
    {
        m_affinity.assertHere();
        m_close = std::move(handler);
    }

    /// True when the event was one of input, whether or not somebody answered it. Keys that nobody took stay unaccepted.
    bool handle(QEvent& event);
    /// Ends every touch that is down, without a release.
    void cancelTouches();

private:
    void touch(const QTouchEvent& event);
    void mouse(const QMouseEvent& event);
    void wheel(const QWheelEvent& event);
    bool key(const QKeyEvent& event);

    void down(int id, base::Point position);
    void move(int id, base::Point position);
    void up(int id, base::Point position);

    platform::Window& m_window;
    const base::Clock& m_clock;
    std::function<void()> m_close;
    std::set<int> m_touches; ///< that are down
    base::Affinity m_affinity;
};

} // namespace qtui

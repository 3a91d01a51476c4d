/// A screen of an X server of the test's own, without a window manager: the editor's window on it, a pointer and a keyboard
/// whose events come through the server as a person's do, and what the window shows. Places are in the window's points.
/// Every wait has a deadline and is woken by the server; throws when there is no server.
#pragma once

#include "end_to_end/Screenshot.h"
#include "support/Child.h"

#include <xcb/damage.h>
#include <xcb/xcb.h>

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

namespace tests {

/// Keys as the X protocol counts them.
enum class XKey : xcb_keysym_t {
    Space = 0x20,
    Comma = 0x2c,
    Period = 0x2e,
    Z = 0x7a,
    Tab = 0xff09,
    Return = 0xff0d,
    Escape = 0xff1b,
    Home = 0xff50,
    Left = 0xff51,
    Right = 0xff53,
    End = 0xff57,
    Control = 0xffe3,
};

class Screen {
public:
    static constexpr int kSide = 2000; ///< pixels, of a screen that every window fits on, upright and on its side
    static constexpr Milliseconds kDeadline = std::chrono::seconds(60);

    /// `scale` is what the window's program takes for a point, in pixels.
    explicit Screen(int scale = 1);
    ~Screen();
    Screen(const Screen&) = delete;
    Screen& operator=(const Screen&) = delete;

    /// For a program's DISPLAY.
    const std::string& name() const { return m_name; }

    /// Until there is a window; it gets the keyboard.
    bool waitForWindow();
    /// Until the window has gone.
    bool waitForNoWindow();

    // One finger, which is the left button.
    void moveTo(double x, double y);
    void press();
    void release();
    void tap(double x, double y);
    /// All are pressed, in that order, and let go.
    void keys(std::initializer_list<XKey> keys);
    void key(XKey key) { keys({key}); }

    // What a window manager does.
    void resize(int width, int height);
    void closeWindow();

    /// What the window shows now.
    Screenshot picture();
    /// Until the window shows that; looks again whenever something has been drawn.
    bool waitFor(const std::function<bool(const Screenshot&)>& wanted, Milliseconds deadline = kDeadline);

private:
    template <typename Reply> using Owned = std::unique_ptr<Reply, void (*)(void*)>;
    using Deadline = std::chrono::steady_clock::time_point;

    /// The next event; null when the deadline has passed first, or the server has gone.
    Owned<xcb_generic_event_t> nextEvent(Deadline until);
    void input(std::uint8_t type, std::uint8_t detail, int x = 0, int y = 0);
    std::uint8_t codeOf(XKey key) const;
    xcb_atom_t atom(const std::string& name);
    /// So that a program that starts afterwards sees what came before.
    void settle();

    const int m_scale;
    std::string m_name;
    std::unique_ptr<Child> m_server;
    xcb_connection_t* m_connection = nullptr;
    xcb_window_t m_root = 0;
    xcb_window_t m_window = 0;
    xcb_damage_damage_t m_damage = 0;
    std::uint8_t m_damaged = 0;        ///< the event's type
    std::uint8_t m_firstCode = 0;      ///< of m_symbols…
    std::uint8_t m_symbolsPerCode = 1; ///< …which has so many of each
    std::vector<xcb_keysym_t> m_symbols;
};

} // namespace tests

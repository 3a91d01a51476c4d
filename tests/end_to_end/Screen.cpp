#include "end_to_end/Screen.h"

#include <xcb/xtest.h>

#include <array>
#include <cmath>
#include <cstdlib>

namespace tests {

namespace {

constexpr int kSmallestWindow = 100; // pixels: toolkits keep small ones of their own, which nobody sees
constexpr std::uint8_t kSent = 0x80; // of an event's type: by another client

std::chrono::steady_clock::time_point after(Milliseconds time)
{
    return std::chrono::steady_clock::now() + time;
}

/// What a pipe has to say until its writers are gone, or a line of it.
std::string firstLine(int descriptor, Milliseconds deadline)
{
    const auto until = after(deadline);
    std::string line;
    while (line.find('\n') == std::string::npos) {
        pollfd poll = {descriptor, POLLIN, 0};
        const auto left = std::chrono::ceil<Milliseconds>(until - std::chrono::steady_clock::now());
        std::array<char, 32> buffer;
        if (left.count() <= 0 || ::poll(&poll, 1, static_cast<int>(left.count())) <= 0)
            return {};
        const ssize_t count = ::read(descriptor, buffer.data(), buffer.size());
        if (count <= 0)
            return {};
        line.append(buffer.data(), static_cast<std::size_t>(count));
    }
    return line.substr(0, line.find('\n'));
}

} // namespace

Screen::Screen(int scale) : m_scale(scale)
{
    std::array<int, 2> pipe{};
    if (::pipe(pipe.data()) != 0)
        throw std::runtime_error("no pipe");
    ::fcntl(pipe[0], F_SETFD, FD_CLOEXEC);
    const std::string side = std::to_string(kSide);
    const char* path = std::getenv("PATH");
    // It chooses a free number, says which, and ends with its last client: with us, whatever becomes of us.
    m_server =
        std::make_unique<Child>(std::vector<std::string>{"Xvfb", "-displayfd", std::to_string(pipe[1]), "-screen", "0",
                                                         side + "x" + side + "x24", "-nolisten", "tcp", "-terminate"},
                                std::vector<std::string>{std::string("PATH=") + (path ? path : "/usr/bin:/bin")});
    ::close(pipe[1]);
    const std::string number = firstLine(pipe[0], kDeadline);
    ::close(pipe[0]);
    if (number.empty())
        throw std::runtime_error("no X server: " + m_server->wait(Milliseconds(0)).err);
    m_name = ":" + number;

    m_connection = ::xcb_connect(m_name.c_str(), nullptr);
    if (::xcb_connection_has_error(m_connection) != 0)
        throw std::runtime_error("the X server takes no connection");
    const xcb_setup_t* setup = ::xcb_get_setup(m_connection);
    m_root = ::xcb_setup_roots_iterator(setup).data->root;
    const std::uint32_t wanted = XCB_EVENT_MASK_SUBSTRUCTURE_NOTIFY;
    ::xcb_change_window_attributes(m_connection, m_root, XCB_CW_EVENT_MASK, &wanted);

    m_damaged = ::xcb_get_extension_data(m_connection, &xcb_damage_id)->first_event + XCB_DAMAGE_NOTIFY;
    const Owned<xcb_damage_query_version_reply_t> version(
        ::xcb_damage_query_version_reply(
            m_connection, ::xcb_damage_query_version(m_connection, XCB_DAMAGE_MAJOR_VERSION, XCB_DAMAGE_MINOR_VERSION),
            nullptr),
        std::free);

    m_firstCode = setup->min_keycode;
    const auto codes = static_cast<std::uint8_t>(setup->max_keycode - m_firstCode + 1);
    const Owned<xcb_get_keyboard_mapping_reply_t> keyboard(
        ::xcb_get_keyboard_mapping_reply(m_connection, ::xcb_get_keyboard_mapping(m_connection, m_firstCode, codes),
                                         nullptr),
        std::free);
    if (!version || !keyboard)
        throw std::runtime_error("the X server lacks damage or a keyboard");
    const xcb_keysym_t* symbols = ::xcb_get_keyboard_mapping_keysyms(keyboard.get());
    m_symbolsPerCode = keyboard->keysyms_per_keycode;
    m_symbols.assign(symbols, symbols + ::xcb_get_keyboard_mapping_keysyms_length(keyboard.get()));
}

Screen::~Screen()
{
    ::xcb_disconnect(m_connection);
    // Asked to go, it takes its socket and its lock along.
    m_server->signal(SIGTERM);
    m_server->wait();
}

Screen::Owned<xcb_generic_event_t> Screen::nextEvent(Deadline until)
{
    for (;;) {
        Owned<xcb_generic_event_t> event(::xcb_poll_for_event(m_connection), std::free);
        const auto left = std::chrono::ceil<Milliseconds>(until - std::chrono::steady_clock::now());
        if (event || left.count() <= 0 || ::xcb_connection_has_error(m_connection) != 0)
            return event;
        pollfd poll = {::xcb_get_file_descriptor(m_connection), POLLIN, 0};
        ::poll(&poll, 1, static_cast<int>(left.count()));
    }
}

bool Screen::waitForWindow()
{
    const auto until = after(kDeadline);
    while (const auto event = nextEvent(until)) {
        if ((event->response_type & ~kSent) != XCB_MAP_NOTIFY)
            continue;
        const xcb_window_t window = reinterpret_cast<const xcb_map_notify_event_t*>(event.get())->window;
        const Owned<xcb_get_geometry_reply_t> geometry(
            ::xcb_get_geometry_reply(m_connection, ::xcb_get_geometry(m_connection, window), nullptr), std::free);
        if (!geometry || geometry->width < kSmallestWindow)
            continue;
        m_window = window;
        m_damage = ::xcb_generate_id(m_connection);
        ::xcb_damage_create(m_connection, m_damage, m_window, XCB_DAMAGE_REPORT_LEVEL_NON_EMPTY);
        ::xcb_set_input_focus(m_connection, XCB_INPUT_FOCUS_POINTER_ROOT, m_window, XCB_CURRENT_TIME);
        settle();
        return true;
    }
    return false;
}

bool Screen::waitForNoWindow()
{
    const auto until = after(kDeadline);
    while (const auto event = nextEvent(until)) {
        const auto type = event->response_type & ~kSent;
        if (type == XCB_UNMAP_NOTIFY
            && reinterpret_cast<const xcb_unmap_notify_event_t*>(event.get())->window == m_window)
            return true;
        if (type == XCB_DESTROY_NOTIFY
            && reinterpret_cast<const xcb_destroy_notify_event_t*>(event.get())->window == m_window)
            return true;
    }
    return false;
}

void Screen::settle()
{
    const Owned<xcb_get_input_focus_reply_t> answer(
        ::xcb_get_input_focus_reply(m_connection, ::xcb_get_input_focus(m_connection), nullptr), std::free);
}

void Screen::input(std::uint8_t type, std::uint8_t detail, int x, int y)
{
    ::xcb_test_fake_input(m_connection, type, detail, XCB_CURRENT_TIME, m_root, static_cast<std::int16_t>(x),
                          static_cast<std::int16_t>(y), 0);
    settle();
}

void Screen::moveTo(double x, double y)
{
    const Owned<xcb_translate_coordinates_reply_t> origin(
        ::xcb_translate_coordinates_reply(m_connection,
                                          ::xcb_translate_coordinates(m_connection, m_window, m_root, 0, 0), nullptr),
        std::free);
    if (origin)
        input(XCB_MOTION_NOTIFY, 0, origin->dst_x + static_cast<int>(std::lround(x * m_scale)),
              origin->dst_y + static_cast<int>(std::lround(y * m_scale)));
}

void Screen::press()
{
    input(XCB_BUTTON_PRESS, XCB_BUTTON_INDEX_1);
}

void Screen::release()
{
    input(XCB_BUTTON_RELEASE, XCB_BUTTON_INDEX_1);
}

void Screen::tap(double x, double y)
{
    moveTo(x, y);
    press();
    release();
}

std::uint8_t Screen::codeOf(XKey key) const
{
    for (std::size_t i = 0; i < m_symbols.size(); i += m_symbolsPerCode)
        if (m_symbols[i] == static_cast<xcb_keysym_t>(key))
            return static_cast<std::uint8_t>(m_firstCode + i / m_symbolsPerCode);
    throw std::runtime_error("the X server's keyboard lacks a key");
}

void Screen::keys(std::initializer_list<XKey> keys)
{
    for (const XKey key : keys)
        input(XCB_KEY_PRESS, codeOf(key));
    for (auto key = keys.end(); key != keys.begin();)
        input(XCB_KEY_RELEASE, codeOf(*--key));
}

void Screen::resize(int width, int height)
{
    const std::array<std::uint32_t, 2> size = {static_cast<std::uint32_t>(width * m_scale),
                                               static_cast<std::uint32_t>(height * m_scale)};
    ::xcb_configure_window(m_connection, m_window, XCB_CONFIG_WINDOW_WIDTH | XCB_CONFIG_WINDOW_HEIGHT, size.data());
    settle();
}

xcb_atom_t Screen::atom(const std::string& name)
{
    const Owned<xcb_intern_atom_reply_t> reply(
        ::xcb_intern_atom_reply(
            m_connection, ::xcb_intern_atom(m_connection, 0, static_cast<std::uint16_t>(name.size()), name.c_str()),
            nullptr),
        std::free);
    return reply ? reply->atom : xcb_atom_t(XCB_ATOM_NONE);
}

void Screen::closeWindow()
{
    xcb_client_message_event_t event = {};
    event.response_type = XCB_CLIENT_MESSAGE;
    event.format = 32;
    event.window = m_window;
    event.type = atom("WM_PROTOCOLS");
    event.data.data32[0] = atom("WM_DELETE_WINDOW");
    ::xcb_send_event(m_connection, 0, m_window, XCB_EVENT_MASK_NO_EVENT, reinterpret_cast<const char*>(&event));
    settle();
}

Screenshot Screen::picture()
{
    const Owned<xcb_get_geometry_reply_t> geometry(
        ::xcb_get_geometry_reply(m_connection, ::xcb_get_geometry(m_connection, m_window), nullptr), std::free);
    if (!geometry)
        return Screenshot(QImage());
    const int width = geometry->width;
    const int height = geometry->height;
    // None when the window has changed or gone since.
    const Owned<xcb_get_image_reply_t> reply(
        ::xcb_get_image_reply(m_connection,
                              ::xcb_get_image(m_connection, XCB_IMAGE_FORMAT_Z_PIXMAP, m_window, 0, 0, geometry->width,
                                              geometry->height, ~std::uint32_t(0)),
                              nullptr),
        std::free);
    if (!reply || ::xcb_get_image_data_length(reply.get()) < width * height * 4)
        return Screenshot(QImage());
    return Screenshot(QImage(::xcb_get_image_data(reply.get()), width, height, QImage::Format_RGB32).copy());
}

bool Screen::waitFor(const std::function<bool(const Screenshot&)>& wanted, Milliseconds deadline)
{
    const auto until = after(deadline);
    for (;;) {
        // First forgotten, then looked at: what is drawn in between is told again.
        ::xcb_damage_subtract(m_connection, m_damage, XCB_NONE, XCB_NONE);
        const Screenshot now = picture();
        if (!now.isNull() && wanted(now))
            return true;
        for (bool isDamaged = false; !isDamaged;) {
            const auto event = nextEvent(until);
            if (!event)
                return false;
            const auto type = event->response_type & ~kSent;
            isDamaged = type == m_damaged || type == XCB_CONFIGURE_NOTIFY;
        }
    }
}

} // namespace tests

#include "app/host/ProgressBar.h"

#include "base/Environment.h"

#include <algorithm>
#include <cmath>
#include <sys/ioctl.h>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

constexpr int kWidest = 100; ///< columns; a longer bar tells no more
constexpr int kShortestBar = 8;
constexpr int kFrame = 9; ///< " [", "]", " 100 %"

bool isTerminal(std::FILE* stream)
{
    return ::isatty(::fileno(stream)) != 0 && base::environment("TERM") != "dumb";
}

int columnsOf(std::FILE* stream)
{
    winsize size = {};
    return ::ioctl(::fileno(stream), TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : 80;
}

/// Letters, of UTF-8.
int lengthOf(const std::string& text)
{
    return static_cast<int>(std::count_if(text.begin(), text.end(),
                                          [](char each) { return (static_cast<unsigned char>(each) & 0xC0) != 0x80; }));
}

} // namespace

std::string progressLine(const std::string& what, double part, int columns)
{
    part = std::isnan(part) ? 0 : std::clamp(part, 0.0, 1.0);
    const std::string percent = std::to_string(static_cast<int>(part * 100));
    const std::string tail = std::string(4 - percent.size(), ' ') + percent + " %";
    const int room = std::min(columns, kWidest) - lengthOf(what) - kFrame;
    if (room < kShortestBar)
        return what + tail;
    const auto length = static_cast<std::size_t>(room);
    const auto filled = static_cast<std::size_t>(part * room);
    return what + " [" + std::string(filled, '#') + std::string(length - filled, '-') + "]" + tail;
}

ProgressBar::ProgressBar(std::string what, std::FILE* stream)
    : m_what(std::move(what)), m_stream(stream), m_isTerminal(isTerminal(stream))
{
}

ProgressBar::~ProgressBar()
{
    m_affinity.assertHere();
    clear();
}

void ProgressBar::show(double part)
{
    m_affinity.assertHere();
    if (!m_isTerminal)
        return;
    std::string line = progressLine(m_what, part, columnsOf(m_stream));
    if (line == m_shown)
        return;
    m_shown = std::move(line);
    std::fprintf(m_stream, "\r\033[K%s", m_shown.c_str());
}

void ProgressBar::clear()
{
    m_affinity.assertHere();
    if (std::exchange(m_shown, {}).empty())
        return;
    std::fputs("\r\033[K", m_stream);
}

} // namespace host

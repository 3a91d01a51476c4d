#include "app/editor/TransitionTrial.h"

#include "app/editor/EditorProgram.h"

#include <QQuickWindow>

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <fstream>
#include <numeric>
#include <unistd.h>

namespace app {

namespace {

constexpr QSize kUpright{390, 844};
constexpr QSize kOnItsSide{844, 390};

template <typename Iterator> double meanMilliseconds(Iterator first, Iterator last)
{
    const auto sum = std::accumulate(first, last, base::Instant(0));
    return std::chrono::duration<double, std::milli>(sum).count() / static_cast<double>(std::distance(first, last));
}

/// Of all threads of this process: what other processes do does not count.
base::Instant processorTime()
{
    timespec time{};
    ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
    return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

} // namespace

long residentKilobytes()
{
    std::ifstream statm("/proc/self/statm");
    long pages = 0;
    long resident = 0;
    statm >> pages >> resident;
    return resident * (::sysconf(_SC_PAGESIZE) / 1024);
}

TransitionTrial::TransitionTrial(EditorProgram& program, int count)
    : m_program(program), m_wanted(static_cast<std::size_t>(kWarmUp + std::max(count, kSample)))
{
}

bool TransitionTrial::goOn()
{
    m_affinity.assertHere();
    QQuickWindow& window = m_program.presenter().quickWindow();
    if (m_running) {
        if (m_program.window().transitionCount() == m_before)
            return false;
        m_program.presenter().commit();
        m_times.push_back(processorTime() - m_started);
        m_running = false;
        if (m_times.size() == kWarmUp)
            m_warmMemory = residentKilobytes();
    }
    if (m_times.size() == m_wanted)
        return true;
    m_before = m_program.window().transitionCount();
    m_started = processorTime();
    m_running = true;
    window.resize(window.size() == kUpright ? kOnItsSide : kUpright);
    return false;
}

std::string TransitionTrial::result() const
{
    m_affinity.assertHere();
    char text[160];
    std::snprintf(text, sizeof text, "transitions %zu first %.3f last %.3f memory %ld %ld", m_wanted - kWarmUp,
                  meanMilliseconds(m_times.begin() + kWarmUp, m_times.begin() + kWarmUp + kSample),
                  meanMilliseconds(m_times.end() - kSample, m_times.end()), m_warmMemory, residentKilobytes());
    return text;
}

} // namespace app

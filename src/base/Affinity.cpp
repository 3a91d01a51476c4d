#include "base/Affinity.h"

#ifndef NDEBUG

#include <cstdlib>
#include <iostream>
#include <sstream>

namespace base {

Affinity::Affinity() : m_thread(std::this_thread::get_id()) {}

Affinity::Affinity(const Affinity& other)
    : m_thread(other.m_thread.load() == std::thread::id() ? std::thread::id() : std::this_thread::get_id())
{
}

Affinity Affinity::detached()
{
    return Affinity(std::thread::id());
}

void Affinity::detach()
{
    m_thread = std::thread::id();
}

void Affinity::assertHere(SourceLocation where) const
{
    const auto here = std::this_thread::get_id();
    std::thread::id owner = m_thread;
    if (owner == here)
        return;
    // Nobody's: the first who asks gets it.
    if (owner == std::thread::id() && m_thread.compare_exchange_strong(owner, here))
        return;
    std::ostringstream words; // one write, as other threads may be writing too
    words << where.file_name() << ':' << where.line() << ": " << where.function_name() << " was called on thread "
          << here << ", but belongs to thread " << owner << '\n';
    std::cerr << words.str() << std::flush;
    std::abort();
}

} // namespace base

#else

#include <type_traits>

static_assert(std::is_empty_v<base::Affinity>, "what users run carries none of it");

#endif

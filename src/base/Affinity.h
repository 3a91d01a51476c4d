/// The one thread that an object belongs to, checked where its header promises one.
///
/// What lives on one thread has an affinity as a member, and asserts it first thing in each entry point. A check that
/// fails is a mistake of ours: it names the place and both threads, and aborts. Builds with NDEBUG check nothing.
#pragma once

// The standard's own is not known to clang 14, which clang-tidy is.
#include <experimental/source_location>

#ifndef NDEBUG
#include <atomic>
#include <thread>
#endif

namespace base {

using SourceLocation = std::experimental::source_location;

#ifndef NDEBUG

class Affinity {
public:
    /// Belongs to the calling thread.
    Affinity();
    /// Belongs to whichever thread asserts first: of what is made by one and used by another.
    static Affinity detached();
    /// A copy of what belongs to a thread belongs to the thread that copies, and one of what is nobody's yet to nobody.
    Affinity(const Affinity& other);
    Affinity& operator=(const Affinity&) { return *this; }

    /// Belongs to whichever thread asserts next: what its owner calls last before it hands the object to another thread.
    void detach();

    /// Aborts on any thread but its own. Any thread.
    void assertHere(SourceLocation where = SourceLocation::current()) const;

private:
    explicit Affinity(std::thread::id thread) : m_thread(thread) {}

    mutable std::atomic<std::thread::id> m_thread;
};

#else

class Affinity {
public:
    static Affinity detached() { return {}; }
    void detach() {}
    void assertHere(SourceLocation = {}) const {}
};

#endif

} // namespace base

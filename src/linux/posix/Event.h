/// That something has happened, as a descriptor to wait for. Any thread.
#pragma once

#include "linux/posix/FileDescriptor.h"

#include <sys/eventfd.h>

namespace posix {

class Event {
public:
    /// For poll(): it can be read from as soon as the event has happened. Not to be read from.
    int descriptor() const { return m_file.get(); }

    void happen() const { ::eventfd_write(m_file.get(), 1); }
    /// Waits for the next one from now on.
    void forget() const
    {
        eventfd_t count = 0;
        ::eventfd_read(m_file.get(), &count);
    }

private:
    FileDescriptor m_file{::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)};
};

} // namespace posix

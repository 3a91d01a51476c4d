/// For callbacks that hold an object of the main queue strongly while they are with another thread.
#pragma once

#include "base/Queue.h"

#include <memory>
#include <utility>

namespace base {

/// Keeps `object` alive like any other reference, but when the last copy of what this gives goes, on whichever thread,
/// `object` goes back to the main queue and is released there: it may be the last reference to it. What is given must
/// not outlive the queue.
template <typename T> std::shared_ptr<T> handedBackTo(MainQueue& mainQueue, std::shared_ptr<T> object)
{
    T* const address = object.get();
    return std::shared_ptr<T>(address, [&mainQueue, object = std::move(object)](T*) mutable {
        mainQueue.post([object = std::move(object)] {});
    });
}

} // namespace base

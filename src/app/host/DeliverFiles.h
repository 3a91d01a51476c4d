/// Brings the files of a request to where its editor finds them. Any thread; takes its time, or for ever, because it
/// reads what belongs to others.
#pragma once

#include "app/host/DetachedWork.h"
#include "app/host/Payload.h"
#include "base/Clock.h"
#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <functional>
#include <memory>
#include <string>

namespace host {

struct FileDelivery {
    posix::FileDescriptor movie;
    std::string movieName;
    std::string movieDirectory;
    std::shared_ptr<Promise> movieArrived;

    std::shared_ptr<Promise> attachmentArrived; ///< null when there is no attachment
    std::string attachmentPath;                 ///< of one that stays where it is, else empty
    posix::FileDescriptor attachment;
    std::string attachmentName;
    std::string attachmentDirectory;
};

struct DeliveryEvents {
    std::function<void(std::uint64_t totalBytes)> copying;   ///< for a second; at most once
    std::function<void(const base::ErrorRef& error)> failed; ///< not when it was stopped
};

/// Keeps the promises and calls the events on the client's thread. Stops when the client does not wait any more.
void deliverFiles(const FileDelivery& delivery, const DeliveryEvents& events, DetachedWork::Client& client,
                  const base::Clock& clock);

} // namespace host

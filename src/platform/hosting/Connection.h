/// The private connection between an extension and its host: one-way messages with named protocols. Any thread.
#pragma once

#include "base/Error.h"
#include "runtime/Selector.h"
#include "runtime/Value.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace platform {

/// What one side of a connection offers the other.
struct ConnectionInterface {
    std::string protocol;
    std::vector<runtime::Selector> methods;

    friend bool operator==(const ConnectionInterface&, const ConnectionInterface&) = default;
};

/// The other side, as something to send messages to.
class RemoteProxy {
public:
    virtual ~RemoteProxy() = default;
    /// Sends a one-way message; nothing comes back. Lists of strings travel as `std::vector<std::string>`.
    /// A message that is not in the other side's interface, or cannot be sent, goes to the error handler.
    virtual void send(const runtime::Selector& message, const runtime::Arguments& arguments) = 0;
};

class AuxiliaryConnection {
public:
    using ErrorHandler = std::function<void(const base::ErrorRef&)>;

    virtual ~AuxiliaryConnection() = default;
    /// The handler is called on the main queue, once for each message that failed.
    virtual std::shared_ptr<RemoteProxy> remoteObjectProxyWithErrorHandler(ErrorHandler handler) = 0;
};

} // namespace platform

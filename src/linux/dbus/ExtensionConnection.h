/// The extension's end of the private connection to its host: fetches the payload, and carries messages back.
///
/// connect() and inputItems() belong to the start-up, one after the other, and block it for a few milliseconds. The rest
/// may be called on any thread. Needs a QCoreApplication, but no running event loop of the caller's.
#pragma once

#include "base/Queue.h"
#include "base/Result.h"
#include "platform/hosting/Connection.h"
#include "platform/hosting/InputItem.h"

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace dbus {

/// The number under which an extension finds the host's lock on its directory among its open files. While it is open
/// the directory counts as alive; nobody needs to do anything with it but keep it from children.
inline constexpr int kEditorLockDescriptor = 3;

class ExtensionConnection final : public platform::AuxiliaryConnection {
public:
    /// Handlers are called on `mainQueue`, which outlives the connection.
    explicit ExtensionConnection(base::Queue& mainQueue);
    /// Waits for messages under way as flush() does. Loads under way complete with an error, on the worker, before this
    /// returns; no handler runs after it. Never on a thread that runs a load's completion.
    ~ExtensionConnection() override;

    /// Once; `address` is what the host gave on the command line.
    base::Result<void> connect(const std::string& address);

    /// Called once, when the host has gone or has closed the connection; at once when that is already so.
    void setDisconnectedHandler(std::function<void()> handler);

    /// Called for each message that the host has been sent, whether it takes it or not.
    void setSentHandler(std::function<void()> handler);

    /// What the host hands over; fetched once, then remembered. Contents are loaded by the attachments: they complete
    /// on a worker of the connection, each when its answer has come: usually, but not always, in the order in which they
    /// were asked for. Text is a `std::string`, a colour a `platform::Color`; anything else,
    /// text above 1 MiB and replies of a wrong form are errors of that attachment alone.
    base::Result<std::vector<platform::InputItem>> inputItems();

    /// What the host answers; messages go to its interface "org.clipsa.<protocol>". Before the first message.
    void setHostInterface(platform::ConnectionInterface hostInterface);

    /// Strings and lists of strings can travel. A message that is still under way when the connection ends is not told
    /// to `handler` but to the disconnected handler: a host closes the connection in answer to the last message.
    std::shared_ptr<platform::RemoteProxy> remoteObjectProxyWithErrorHandler(ErrorHandler handler) override;

    /// Waits until the host has all messages, the connection has ended, or the limit has passed; false for the last.
    bool flush(std::chrono::milliseconds limit = std::chrono::seconds(2));

private:
    struct Shared;
    class Proxy;
    class Provider;

    std::shared_ptr<Shared> m_shared;
    std::vector<platform::InputItem> m_items;
    bool m_fetched = false;
};

} // namespace dbus

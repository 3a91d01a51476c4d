/// The host's end of the private connection to the extension that it started: a server for one peer of the same user,
/// which hands out the payload and takes the message that the user has finished.
///
/// Lives on one thread, whose Qt event loop runs; handlers are called there and may destroy the connection.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "platform/hosting/InputItem.h"
#include "runtime/Value.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace dbus {

/// What an item is answered with: text as `std::string`, a colour as `platform::Color`, or why there is none.
using LoadedItem = std::function<void(const base::Result<runtime::Value>& item)>;

struct HostAttachment {
    std::vector<std::string> types = {platform::kGenericDataType};
    /// Called for each load, on the connection's thread; may answer later, on any thread, once.
    std::function<void(LoadedItem answer)> load;

    /// One whose contents are known.
    static HostAttachment of(runtime::Value value, std::string type);
};

struct HostItem {
    std::string title;
    std::vector<HostAttachment> attachments;
};

class HostConnection {
public:
    struct Handlers {
        std::function<void()> editorConnected;
        /// The user has finished; at most once.
        std::function<void(std::vector<std::string> activityTypes)> finished;
        /// The editor's end is closed: at most once, and not because of disconnectEditor().
        std::function<void()> disconnected;
    };

    /// The longest path of a socket that libdbus takes, which leaves some of the 108 bytes of an address alone.
    static constexpr std::size_t kMaximumPathSize = 99;

    /// Listens on a new socket at `path`, in a directory that nobody else can write to.
    static base::Result<std::unique_ptr<HostConnection>> listen(const std::string& path, std::vector<HostItem> items,
                                                                Handlers handlers);
    /// Closes the connection; the extension takes that as the request to end.
    ~HostConnection();

    /// For the extension's command line.
    std::string address() const;

    /// Closes the connection, and takes no other.
    void disconnectEditor();

private:
    struct State;

    explicit HostConnection(std::unique_ptr<State> state);

    std::unique_ptr<State> m_state;
    base::Affinity m_affinity;
};

} // namespace dbus

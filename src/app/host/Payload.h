/// What an editor is handed, as items: the optional values first, the required ones last, so that an editor that loads
/// them in this order has everything when the last required one arrives, and is built once.
#pragma once

#include "base/Result.h"
#include "linux/dbus/EditRequest.h"
#include "linux/dbus/HostConnection.h"

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace host {

/// A value that is handed over as soon as it is there; whoever asks earlier is answered then. Any thread.
class Promise {
public:
    /// Once.
    void keep(base::Result<runtime::Value> value);
    void whenKept(dbus::LoadedItem answer);

private:
    std::mutex m_mutex;
    std::optional<base::Result<runtime::Value>> m_value;
    std::vector<dbus::LoadedItem> m_waiting;
};

/// `movie` and `attachment` are promises of paths as the editor knows them; `attachment` is null without one.
std::vector<dbus::HostItem> payloadItems(const dbus::EditRequest& request, std::shared_ptr<Promise> movie,
                                         std::shared_ptr<Promise> attachment);

} // namespace host

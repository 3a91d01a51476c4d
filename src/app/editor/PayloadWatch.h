/// Tells when everything that was asked of a payload has been answered, so that the window opens on something.
///
/// Wraps the items' attachments; any thread. The answer comes on the main queue, after what the loads posted there.
#pragma once

#include "base/Queue.h"
#include "platform/hosting/InputItem.h"

#include <functional>
#include <memory>
#include <vector>

namespace app {

class PayloadWatch {
public:
    PayloadWatch(base::MainQueue& mainQueue, std::function<void()> settled);

    /// The same items, watched.
    std::vector<platform::InputItem> watched(std::vector<platform::InputItem> items);
    /// All loads have been started: from now on, none under way means settled.
    void startedAll();

private:
    struct State;
    class Provider;

    std::shared_ptr<State> m_state;
};

} // namespace app

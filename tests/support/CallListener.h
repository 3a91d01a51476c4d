/// Hears of what is asked of several fakes, in one order: each call as a few words, before it has an effect. The thread
/// of the call.
#pragma once

#include <functional>
#include <memory>
#include <string>

namespace tests {

struct CallListener {
    std::function<void(const std::string& call)> heard;

    void operator()(const std::string& call) const
    {
        if (heard)
            heard(call);
    }
};

using CallListenerRef = std::shared_ptr<CallListener>;

} // namespace tests

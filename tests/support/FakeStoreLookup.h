/// A store in memory: it remembers what it was asked, and answers when a test says so, or at once. Answers come
/// on a thread of its own.
#pragma once

#include "platform/storefront/StoreLookup.h"

#include <cassert>
#include <deque>
#include <optional>
#include <thread>
#include <utility>
#include <vector>

namespace tests {

/// Asked and told to answer on one thread.
class FakeStoreLookup final : public platform::StoreLookup {
public:
    void start(platform::StoreLookupRequest request, Callback callback) override
    {
        requests.push_back(std::move(request));
        m_waiting.push_back(std::move(callback));
        if (answersAtOnce)
            answer(*answersAtOnce);
    }

    /// Answers the oldest request that waits, on a thread of the store's, and waits until it has been told.
    void answer(std::vector<platform::StoreItem> results)
    {
        tell(platform::StoreLookupResponse{std::move(results)}, nullptr);
    }
    void fail(const base::ErrorRef& error) { tell(std::nullopt, error); }
    /// The store ends: who waits is never answered.
    void end()
    {
        std::thread([waiting = std::exchange(m_waiting, {})] {}).join();
    }

    bool isBusy() const { return !m_waiting.empty(); }

    /// What every request is answered with before start() returns, when there is something here.
    std::optional<std::vector<platform::StoreItem>> answersAtOnce;
    /// All that was asked, in order.
    std::vector<platform::StoreLookupRequest> requests;
    /// The thread on which the last request was answered.
    std::thread::id answeredOn;

private:
    void tell(const std::optional<platform::StoreLookupResponse>& response, const base::ErrorRef& error)
    {
        assert(isBusy());
        std::thread([&, callback = std::exchange(m_waiting.front(), nullptr)] {
            answeredOn = std::this_thread::get_id();
            callback(response, error);
        }).join();
        m_waiting.pop_front();
    }

    std::deque<Callback> m_waiting;
};

} // namespace tests

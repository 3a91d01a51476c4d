/// A photo library in memory: it remembers what it was asked for, and ends its transactions when a test says so. Main
/// thread only.
#pragma once

#include "platform/photos/PhotoLibrary.h"
#include "support/CallListener.h"

#include <cassert>
#include <cerrno>
#include <deque>
#include <optional>
#include <utility>
#include <vector>

namespace tests {

class FakePhotoLibrary final : public platform::PhotoLibrary {
public:
    void performChanges(ChangeBlock changes, Completion completion) override
    {
        (*listener)("library");
        m_waiting.push_back({std::move(changes), std::move(completion), nullptr, {}});
        if (runsBlocksAtOnce)
            runBlock();
    }

    /// Runs the oldest change block that has not run yet.
    void runBlock()
    {
        assert(hasBlock());
        Transaction& transaction = m_waiting.front();
        Change change{*this, nullptr};
        std::exchange(transaction.changes, nullptr)(change);
        transaction.error = change.error;
        m_begun.push_back(std::move(transaction));
        m_waiting.pop_front();
    }

    /// Ends the oldest transaction whose block has run, and tells so at once on the caller's thread.
    void finish() { end(nullptr); }
    void fail(const base::ErrorRef& error) { end(error); }

    bool hasBlock() const { return !m_waiting.empty(); }
    bool isBusy() const { return !m_begun.empty(); }

    /// Hears of each transaction.
    const CallListenerRef listener = std::make_shared<CallListener>();

    bool runsBlocksAtOnce = true;
    /// All that was asked for.
    std::vector<std::optional<base::Url>> urls;
    /// What has succeeded.
    std::vector<base::Url> assets;

private:
    struct Transaction {
        ChangeBlock changes;
        Completion completion;
        base::ErrorRef error;
        std::vector<base::Url> assets;
    };

    struct Change final : platform::PhotoLibraryChange {
        Change(FakePhotoLibrary& theLibrary, base::ErrorRef theError) : library(theLibrary), error(std::move(theError))
        {
        }
        void createAssetFromVideoAtFileURL(const std::optional<base::Url>& url) override
        {
            library.urls.push_back(url);
            if (url)
                library.m_waiting.front().assets.push_back(*url);
            else if (!error)
                error = base::Error::make(base::kPosixErrorDomain, EINVAL, "there is no movie");
        }
        FakePhotoLibrary& library;
        base::ErrorRef error;
    };

    void end(base::ErrorRef error)
    {
        assert(isBusy());
        const Transaction transaction = std::move(m_begun.front());
        m_begun.pop_front();
        if (!error)
            error = transaction.error;
        if (!error)
            assets.insert(assets.end(), transaction.assets.begin(), transaction.assets.end());
        transaction.completion(!error, error);
    }

    std::deque<Transaction> m_waiting;
    std::deque<Transaction> m_begun;
};

} // namespace tests

#include "base/WorkList.h"

#include <algorithm>
#include <mutex>
#include <utility>
#include <vector>

namespace base {

/// Shared with the works, which may outlive the list.
struct WorkList::State {
    std::mutex mutex;
    std::vector<const Entry*> entries;

    std::mutex handlerMutex; ///< held while the handler runs, so that the list's end can wait for it
    std::function<void()> handler;

    void changed()
    {
        const std::lock_guard lock(handlerMutex);
        if (handler)
            handler();
    }
};

class WorkList::Entry final : public Work {
public:
    explicit Entry(std::shared_ptr<State> state) : m_state(std::move(state)) {}
    ~Entry() override
    {
        {
            const std::lock_guard lock(m_state->mutex);
            std::erase(m_state->entries, this);
        }
        m_state->changed();
    }

    void setProgress(double progress) override
    {
        {
            const std::lock_guard lock(m_state->mutex);
            m_progress = std::clamp(progress, 0.0, 1.0);
        }
        m_state->changed();
    }

    std::optional<double> progress() const { return m_progress; } ///< under the state's lock

private:
    const std::shared_ptr<State> m_state;
    std::optional<double> m_progress;
};

WorkList::WorkList() : m_state(std::make_shared<State>()) {}

WorkList::~WorkList()
{
    const std::lock_guard lock(m_state->handlerMutex);
    m_state->handler = nullptr;
}

std::shared_ptr<Work> WorkList::begin()
{
    auto entry = std::make_shared<Entry>(m_state);
    {
        const std::lock_guard lock(m_state->mutex);
        m_state->entries.push_back(entry.get());
    }
    m_state->changed();
    return entry;
}

bool WorkList::isEmpty() const
{
    const std::lock_guard lock(m_state->mutex);
    return m_state->entries.empty();
}

std::optional<double> WorkList::progress() const
{
    const std::lock_guard lock(m_state->mutex);
    double sum = 0;
    int known = 0;
    for (const Entry* entry : m_state->entries) {
        if (const auto progress = entry->progress()) {
            sum += *progress;
            ++known;
        }
    }
    return known > 0 ? std::optional(sum / known) : std::nullopt;
}

void WorkList::setChangeHandler(std::function<void()> handler)
{
    const std::lock_guard lock(m_state->handlerMutex);
    m_state->handler = std::move(handler);
}

} // namespace base

#include "app/editor/PayloadWatch.h"

#include <atomic>
#include <utility>

namespace app {

struct PayloadWatch::State {
    base::MainQueue& mainQueue;
    std::function<void()> settled;
    std::atomic<int> underWay = 1; ///< one for the start itself

    void end()
    {
        if (--underWay == 0)
            mainQueue.post(settled);
    }
};

class PayloadWatch::Provider final : public platform::ItemProvider {
public:
    Provider(std::shared_ptr<platform::ItemProvider> inner, std::shared_ptr<State> state)
        : m_inner(std::move(inner)), m_state(std::move(state))
    {
    }

    bool hasItemConformingToTypeIdentifier(std::string_view type) const override
    {
        return m_inner->hasItemConformingToTypeIdentifier(type);
    }
    void loadItemForTypeIdentifier(std::string_view type, LoadCompletion completion) override
    {
        ++m_state->underWay;
        m_inner->loadItemForTypeIdentifier(type, [state = m_state, completion = std::move(completion)](
                                                     const runtime::Value& item, const base::ErrorRef& error) {
            completion(item, error);
            state->end();
        });
    }

private:
    std::shared_ptr<platform::ItemProvider> m_inner;
    std::shared_ptr<State> m_state;
};

PayloadWatch::PayloadWatch(base::MainQueue& mainQueue, std::function<void()> settled)
    : m_state(new State{mainQueue, std::move(settled)})
{
}

std::vector<platform::InputItem> PayloadWatch::watched(std::vector<platform::InputItem> items)
{
    for (platform::InputItem& item : items)
        for (auto& attachment : item.attachments)
            attachment = std::make_shared<Provider>(attachment, m_state);
    return items;
}

void PayloadWatch::startedAll()
{
    m_state->end();
}

} // namespace app

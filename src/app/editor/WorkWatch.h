/// Watches what is under way in the background: tells whoever waits for its end, and shows what lasts. Main queue.
#pragma once

#include "base/Affinity.h"
#include "base/Queue.h"
#include "base/WorkList.h"

#include <functional>
#include <memory>
#include <optional>

namespace app {

class WorkWatch {
public:
    /// What is over sooner is not worth a word.
    static constexpr base::Instant kDelay = std::chrono::milliseconds(500);

    struct Handlers {
        std::function<void()> begun;                              ///< something is under way, where nothing was
        std::function<void()> ended;                              ///< nothing is under way any more
        std::function<void(std::optional<double> progress)> show; ///< it lasts; again whenever its progress changes
        std::function<void()> hide;                               ///< behind a show
    };

    /// Takes the list's change handler. The list outlives this.
    WorkWatch(base::MainQueue& mainQueue, base::WorkList& list, Handlers handlers);
    ~WorkWatch();

    /// Whether anything is under way now, told or not.
    bool isWorking() const
    {
        m_affinity.assertHere();
        return !m_list.isEmpty();
    }

private:
    struct Link;

    void update();
    void show();

    base::MainQueue& m_mainQueue;
    base::WorkList& m_list;
    Handlers m_handlers;
    std::shared_ptr<Link> m_link;
    bool m_working = false;
    bool m_shown = false;
    unsigned m_serial = 0; ///< of the times that work began
    base::Affinity m_affinity;
};

} // namespace app

/// The time observers of a player: who waits for which moments, and whom a step of playing reaches. Main queue only.
///
/// Periodic observers wait for the multiples of their interval on the item's time line. Observers may come and go, and
/// destroy the player, while they are called; none is called after it was removed or this is gone.
#pragma once

#include "base/Affinity.h"
#include "base/MediaTime.h"
#include "platform/media/Player.h"

#include <functional>
#include <memory>
#include <optional>
#include <vector>

namespace platform {

class TimeObservers {
public:
    using Token = Player::ObserverToken;

    TimeObservers() = default;
    TimeObservers(const TimeObservers&) = delete;
    TimeObservers& operator=(const TimeObservers&) = delete;
    ~TimeObservers();

    /// An interval that is not a positive time is called after jumps only.
    [[nodiscard]] Token addPeriodic(base::MediaTime interval, std::function<void(base::MediaTime)> callback);
    [[nodiscard]] Token addBoundary(std::vector<base::MediaTime> times, std::function<void()> callback);
    /// Does nothing for a token that is not (or no longer) known.
    void remove(const Token& token);
    bool isEmpty() const
    {
        m_affinity.assertHere();
        return m_entries.empty();
    }

    /// The first moment behind `time` for which somebody waits.
    std::optional<base::MediaTime> nextAfter(base::MediaTime time) const;
    /// Calls, once each, those who wait for a moment behind `from` and not behind `to`.
    void played(base::MediaTime from, base::MediaTime to);
    /// Calls the periodic observers: time has jumped.
    void jumped(base::MediaTime to);

private:
    struct Entry {
        bool active = true;
        base::MediaTime interval; ///< of a periodic observer
        std::vector<base::MediaTime> times;
        std::function<void(base::MediaTime)> periodic;
        std::function<void()> boundary;

        std::optional<base::MediaTime> nextAfter(base::MediaTime time) const;
    };

    std::vector<std::shared_ptr<Entry>> m_entries;
    base::Affinity m_affinity;
};

} // namespace platform

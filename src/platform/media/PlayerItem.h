/// An asset as it is being played: whether it can be, how long it is, where it stands. Main queue only.
#pragma once

#include "base/Error.h"
#include "platform/media/Asset.h"

#include <memory>

namespace platform {

/// Posted on the main queue, with the item as its object, when playing has reached the item's end.
inline constexpr const char* kPlayerItemDidPlayToEndNotification = "PlayerItemDidPlayToEnd";

class PlayerItem : public runtime::Object {
public:
    enum class Status { Unknown = 0, ReadyToPlay = 1, Failed = 2 };

    /// Observable keys; told on the main queue.
    static constexpr const char* kStatusKey = "status";
    static constexpr const char* kDurationKey = "duration";

    virtual std::shared_ptr<Asset> asset() const = 0;
    virtual Status status() const = 0;
    /// Why it failed; null otherwise.
    virtual base::ErrorRef error() const = 0;
    /// Indefinite until the item is ready.
    virtual base::MediaTime duration() const = 0;
    virtual base::MediaTime currentTime() const = 0;
};

} // namespace platform

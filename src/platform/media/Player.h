/// Plays an item: its clock, its sound, its current picture. Main queue only; observers are called there.
///
/// Observers and callbacks never run inside the call that causes them, and never after the player is gone.
#pragma once

#include "base/MediaTime.h"
#include "base/Queue.h"
#include "platform/media/PlayerItem.h"
#include "platform/media/VideoFrame.h"

#include <functional>
#include <memory>
#include <vector>

namespace platform {

enum class ActionAtItemEnd { Pause, None };

class Player : public runtime::Object {
public:
    /// What `addPeriodicTimeObserver` and `addBoundaryTimeObserver` give back; opaque.
    using ObserverToken = std::shared_ptr<void>;

    virtual std::shared_ptr<PlayerItem> currentItem() const = 0;

    virtual void play() = 0;
    virtual void pause() = 0;
    virtual bool isPlaying() const = 0;

    /// Where it stands, in the timescale of the movie's picture.
    virtual base::MediaTime currentTime() const = 0;
    /// Shows the picture that is visible at `time`, exactly. Both ends clamp; a newer seek overtakes an older one.
    /// A time that is not numeric is ignored.
    virtual void seekToTime(base::MediaTime time) = 0;
    /// Pauses, and shows the picture that many pictures behind (or before, when negative) the one that is shown; ends
    /// clamp. Several calls add up.
    virtual void stepByCount(int frames) = 0;

    virtual void setActionAtItemEnd(ActionAtItemEnd action) = 0;

    /// Called every `interval` while playing, and after each seek and step.
    [[nodiscard]] virtual ObserverToken addPeriodicTimeObserver(base::MediaTime interval,
                                                                std::function<void(base::MediaTime)> callback) = 0;
    /// Called whenever playing passes one of `times`. One that pauses at the item's end has not kept it from ending: that
    /// is announced next.
    [[nodiscard]] virtual ObserverToken addBoundaryTimeObserver(std::vector<base::MediaTime> times,
                                                                std::function<void()> callback) = 0;
    virtual void removeTimeObserver(const ObserverToken& token) = 0;

    /// The picture to show now; null until there is one.
    virtual VideoFrameRef currentFrame() const = 0;
    /// Called when `currentFrame()` has changed. One handler a player: its layer's.
    virtual void setFrameHandler(std::function<void()> handler) = 0;
};

} // namespace platform

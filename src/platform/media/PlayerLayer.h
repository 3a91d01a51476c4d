/// Draws a player's picture, fitted into the layer's frame with its proportions kept. Main queue only.
#pragma once

#include "platform/media/Player.h"
#include "platform/views/Layer.h"

#include <optional>
#include <string_view>

namespace platform {

class PlayerLayer final : public Layer, private runtime::KeyValueObserver {
public:
    ~PlayerLayer() override;

    static std::shared_ptr<PlayerLayer> withPlayer(const std::shared_ptr<Player>& player);

    const std::shared_ptr<Player>& player() const { return here(m_player); }
    void setPlayer(const std::shared_ptr<Player>& player);

    /// Null when there is no player, or no picture yet.
    VideoFrameRef currentFrame() const { return here(m_player) ? m_player->currentFrame() : nullptr; }
    // What to tell the user.
    /// In place of a picture: that the item cannot be played, and why, where that is known.
    bool hasFailed() const;
    base::ErrorRef failure() const;
    /// Over the first picture: that the movie was cut off. Nothing elsewhere, and while it plays.
    std::optional<CutOff> notice() const;
    /// Where the picture stands inside `bounds`; empty without a picture.
    base::Rect videoRect(base::Rect bounds) const;

private:
    PlayerLayer() = default;

    void observeValueForKeyPath_ofObject_change_context(std::string_view keyPath, runtime::Object& object,
                                                        const runtime::KeyValueChange& change, void* context) override;
    void follow(const std::shared_ptr<Player>& player);
    void unfollow();

    std::shared_ptr<Player> m_player;
    std::shared_ptr<PlayerItem> m_item; ///< the player's, as observed
};

} // namespace platform

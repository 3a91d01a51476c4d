/// Draws a player's picture, fitted into the layer's frame with its proportions kept. Main queue only.
#pragma once

#include "platform/media/Player.h"
#include "platform/views/Layer.h"

namespace platform {

class PlayerLayer final : public Layer {
public:
    ~PlayerLayer() override;

    static std::shared_ptr<PlayerLayer> withPlayer(const std::shared_ptr<Player>& player);

    const std::shared_ptr<Player>& player() const { return m_player; }
    void setPlayer(const std::shared_ptr<Player>& player);

    /// Null when there is no player, or no picture yet.
    VideoFrameRef currentFrame() const { return m_player ? m_player->currentFrame() : nullptr; }
    /// Where the picture stands inside `bounds`; empty without a picture.
    base::Rect videoRect(base::Rect bounds) const;

private:
    PlayerLayer() = default;

    std::shared_ptr<Player> m_player;
};

} // namespace platform

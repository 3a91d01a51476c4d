/// The role of the media engine: makes assets and what plays, shows and exports them. Main queue only.
#pragma once

#include "platform/media/Asset.h"
#include "platform/media/ExportSession.h"
#include "platform/media/ImageGenerator.h"
#include "platform/media/Player.h"
#include "platform/media/PlayerItem.h"

#include <memory>
#include <optional>

namespace platform {

class MediaFramework {
public:
    virtual ~MediaFramework() = default;

    /// Opens the movie on a worker. No URL gives an asset that fails.
    virtual std::shared_ptr<Asset> assetWithURL(const std::optional<base::Url>& url) = 0;
    virtual std::shared_ptr<PlayerItem> playerItemWithAsset(const std::shared_ptr<Asset>& asset) = 0;
    virtual std::shared_ptr<Player> playerWithPlayerItem(const std::shared_ptr<PlayerItem>& item) = 0;
    virtual std::shared_ptr<ImageGenerator> imageGeneratorWithAsset(const std::shared_ptr<Asset>& asset) = 0;
    virtual std::shared_ptr<ExportSession> exportSessionWithAsset(const std::shared_ptr<Asset>& asset,
                                                                  ExportPreset preset) = 0;
};

} // namespace platform

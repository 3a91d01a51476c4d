/// Shows the strip with thumbnails and its play head. Moving the play head does not draw the strip again. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"
#include "platform/views/MovieScrubber.h"

namespace qtui {

class ScrubberItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;

private:
    /// All that the strip's looks depend on.
    struct TrackState {
        QRectF rect;
        std::vector<double> timestamps;
        std::map<double, platform::ImageRef> thumbnails;
        bool loaded = false;
        std::uint64_t generation = 0;
        friend bool operator==(const TrackState&, const TrackState&) = default;
    };

    Sprite drawTrack(const TrackState& state) const;
    Sprite drawPlayHead(double x, bool held) const;

    TrackState m_trackState;
    Sprite m_track;
};

} // namespace qtui

/// Shows the strip with its thumbnails. What stands on it has items of its own, so that moving those does not draw the
/// strip again. GUI thread.
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
        QRectF strip;
        QRectF track;
        std::vector<double> timestamps;
        std::map<double, platform::ImageRef> thumbnails;
        bool zoomed = false;
        double visibleStart = 0;
        double visibleEnd = 0;
        std::uint64_t generation = 0;
        friend bool operator==(const TrackState&, const TrackState&) = default;
    };

    Sprite drawTrack(const TrackState& state) const;
    void drawThumbnails(QPainter& painter, const TrackState& state) const;
    void drawRuler(QPainter& painter, const TrackState& state) const;

    TrackState m_trackState;
    Sprite m_track;
};

} // namespace qtui

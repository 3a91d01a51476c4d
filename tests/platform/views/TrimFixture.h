/// A scrubber whose handles can be taken, in a window.
#pragma once

#include "ScrubberFixture.h"

#include <utility>

namespace tests {

inline constexpr base::Instant kZoomDelay = std::chrono::milliseconds(500);

/// The track is 10 points a second: from 26 to 326 of a strip of 352.
struct Trims : Scrubbers {
    Trims()
    {
        scrubber->setFrame(base::Rect::make(0, 100, 352, 38));
        scrubber->setEditable(true);
        scrubber->setMinimumTrimLength(1);
        scrubber->setZoomDelay(0.5);
        scrubber->reloadData();
        scrubber->setValue(15);
        window->commit();
        movie->requested.clear();
    }
    void down(double x) { window->touchDown({1, {x, 119}, {}}); }
    void move(double x) { window->touchMove({1, {x, 119}, {}}); }
    void up(double x) { window->touchUp({1, {x, 119}, {}}); }
    double startX() const { return scrubber->startHandle()->frame().maxX(); }
    double endX() const { return scrubber->endHandle()->frame().minX(); }
    std::vector<std::string> said() { return std::exchange(movie->said, {}); }
    void enter()
    {
        scrubber->setEditing_animated(true, false);
        said();
    }
};

} // namespace tests

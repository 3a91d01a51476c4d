/// What stands out from its ground without being a control: the ground of a sheet, a popover with its arrow, an alert, and
/// the small marks that lists and progress are made of. Drawn in the presenter's scheme. Main queue only.
#pragma once

#include "platform/views/View.h"

namespace platform {

class SurfaceView final : public View {
public:
    enum class Style {
        Sheet,   ///< round at the top, goes on below the screen's end
        Popover, ///< round, with a shadow and perhaps an arrow
        Alert,   ///< the same, without one
        Grabber, ///< at a sheet's top: it can be pulled
        Scroller,
        Separator,
        Track, ///< of progress: what is still to be done
        Fill,  ///< and what has been done
        Dot,
    };
    /// Outside of the frame, in the middle above `position` (x in own coordinates).
    struct Arrow {
        enum class Edge { None, Top, Bottom };
        Edge edge = Edge::None;
        double position = 0;
        friend bool operator==(const Arrow&, const Arrow&) = default;
    };
    static constexpr double kArrowHeight = 10;
    static constexpr double kArrowWidth = 20;
    /// Of the corners of sheets, popovers and alerts.
    static constexpr double kCorner = 12;

    explicit SurfaceView(Style style, base::Rect frame = {}) : View(frame), m_style(style) {}

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    Style style() const { return here(m_style); }
    Arrow arrow() const { return here(m_arrow); }
    void setArrow(Arrow arrow);

    /// A sheet, a popover and an alert are dialogs, named by their label; marks are nothing.
    Accessibility accessibility() const override;

private:
    Style m_style;
    Arrow m_arrow;
};

} // namespace platform

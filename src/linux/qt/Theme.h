/// The colours of everything that the presenter draws itself, in a light and a dark scheme. A value.
///
/// Text and glyphs keep a contrast of 4.5:1 or more on what they stand on, whatever picture shines through.
#pragma once

#include "platform/views/Color.h"

#include <QColor>

namespace qtui {

enum class Scheme { Light, Dark };

/// What the desktop asks for. Qt 6.4 does not know the scheme itself; the lightness of its palette tells.
Scheme systemScheme();

QColor toQColor(const platform::Color& color);

struct Theme {
    Scheme scheme = Scheme::Light;
    QColor text;        ///< titles and labels
    QColor accent;      ///< what can be pressed, unless it has a tint colour
    QColor destructive; ///< the same, where it cannot be taken back
    QColor surface;     ///< of sheets, popovers and alerts: nothing shines through
    QColor edge;        ///< around them
    QColor shadow;      ///< of one of the rings that make up a shadow
    QColor pressed;     ///< under a row that is pressed
    QColor mark;        ///< grabbers and scrollers
    QColor track;       ///< of progress, where nothing is done yet
    QColor bar;         ///< over the blur behind a bar: opaque enough for text on any picture
    QColor chrome;      ///< over the blur behind the scrubber's strip
    QColor disc;        ///< over the blur of a masked backdrop; light in both schemes, as its glyph is dark
    QColor hairline;    ///< the bar's edge toward the content
    QColor trim;        ///< the frame around the range that is kept
    QColor trimMark;    ///< on its grips
    QColor trimOutline; ///< around it, where it stands on a bright ground
    QColor focusRing;
    QColor focusContrast; ///< around the ring, so that it shows on any picture

    static Theme forScheme(Scheme scheme);

    /// Black stands for "the text colour" and adapts; every other colour is drawn as it is.
    QColor label(const platform::Color& color) const;
};

namespace metrics {

constexpr double kDisabledOpacity = 0.38;
constexpr double kPressedOpacity = 0.45;
constexpr double kGlyphSize = 24;
constexpr double kTitleSize = 17;
constexpr double kCorner = 8;
constexpr double kFocusRing = 2;

} // namespace metrics

} // namespace qtui

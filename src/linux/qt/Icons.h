/// The presenter's own pictures: vector files compiled into the program, drawn sharp at any scale. GUI thread.
#pragma once

#include "base/Affinity.h"

#include <QColor>
#include <QImage>

#include <map>
#include <string>
#include <tuple>

namespace qtui {

/// Makes the compiled-in files known to Qt. Any number of times.
void loadResources();

/// Draws the vector file at `path` as large as it says, or on `size` points; null when there is none.
QImage renderVector(const QString& path, QSizeF size, double scale);
/// As large as the file says, in points; empty when there is none.
QSizeF vectorSize(const QString& path);

/// Glyphs by name ("play"), on a square of 24 points, in one colour. What was drawn once is kept.
class Icons {
public:
    /// Transparent, with a warning on the log the first time, when there is no such glyph.
    QImage glyph(const std::string& name, const QColor& color, double scale);

private:
    base::Affinity m_affinity;
    std::map<std::tuple<std::string, QRgb, double>, QImage> m_glyphs;
};

} // namespace qtui

/// Lines of text in the system's font. GUI thread.
#pragma once

#include <QFont>
#include <QRectF>
#include <QString>

#include <vector>

class QPainter;
class QColor;

namespace qtui {

struct TextLine {
    QString text;
    QFont font;
    Qt::Alignment alignment = Qt::AlignLeft; ///< horizontal; it always stands in the middle of its height
};

/// `size` in points, which are the presenter's pixels before scaling.
QFont systemFont(double size, QFont::Weight weight = QFont::Normal);

/// The line, shortened with an ellipsis where it is wider than `width`.
TextLine fitted(TextLine line, double width);
/// Set smaller, down to four fifths, before anything is cut off.
TextLine squeezed(TextLine line, double width);

/// The lines that `text` takes where there is so much room across, at most `mostLines` of them (0: any number), the last
/// one with an ellipsis where more would follow. Each reads in the direction of its paragraph.
std::vector<QString> wrapped(const QString& text, const QFont& font, double width, int mostLines);
/// From one line to the next, in whole points.
double lineHeight(const QFont& font);

/// What the line covers when it stands in `frame`; can be higher than the frame, as letters are not cut off.
QRectF textArea(const TextLine& line, const QRectF& frame);
void drawText(QPainter& painter, const TextLine& line, const QRectF& frame, const QColor& color, double scale);

/// Whether there is any font at all: without one every letter is an empty box and nobody says so.
bool hasFonts();

} // namespace qtui

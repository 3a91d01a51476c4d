#include "linux/qt/items/Text.h"

#include <QFontDatabase>
#include <QFontMetricsF>
#include <QPainter>

#include <algorithm>
#include <cmath>

namespace qtui {

namespace {

constexpr double kSmallest = 0.8;

} // namespace

QFont systemFont(double size, QFont::Weight weight)
{
    QFont font = QFontDatabase::systemFont(QFontDatabase::GeneralFont);
    // Whole pixels before scaling is all that Qt takes; fractions are rare and made up for by the nearest.
    font.setPixelSize(std::max(1, static_cast<int>(std::lround(size))));
    font.setWeight(weight);
    return font;
}

TextLine fitted(TextLine line, double width)
{
    const QFontMetricsF metrics(line.font);
    if (metrics.horizontalAdvance(line.text) > width)
        line.text = metrics.elidedText(line.text, Qt::ElideRight, width);
    return line;
}

TextLine squeezed(TextLine line, double width)
{
    const int smallest = static_cast<int>(std::ceil(line.font.pixelSize() * kSmallest));
    while (line.font.pixelSize() > smallest && QFontMetricsF(line.font).horizontalAdvance(line.text) > width)
        line.font.setPixelSize(line.font.pixelSize() - 1);
    return fitted(std::move(line), width);
}

QRectF textArea(const TextLine& line, const QRectF& frame)
{
    const QFontMetricsF metrics(line.font);
    const double height = std::ceil(metrics.height()) + 2;
    // Slanted and wide letters reach a little beyond their advance.
    return {frame.left() - 1, frame.center().y() - height / 2, frame.width() + 2, height};
}

void drawText(QPainter& painter, const TextLine& line, const QRectF& frame, const QColor& color, double scale)
{
    const QFontMetricsF metrics(line.font);
    const double width = metrics.horizontalAdvance(line.text);
    double x = frame.left();
    if (line.alignment & Qt::AlignHCenter)
        x = frame.center().x() - width / 2;
    else if (line.alignment & Qt::AlignRight)
        x = frame.right() - width;
    const double baseline = frame.center().y() + (metrics.ascent() - metrics.descent()) / 2;
    const auto snapped = [scale](double value) { return std::round(value * scale) / scale; };
    painter.setFont(line.font);
    painter.setPen(color);
    painter.drawText(QPointF(snapped(x), snapped(baseline)), line.text);
}

bool hasFonts()
{
    return !QFontDatabase::families().isEmpty();
}

} // namespace qtui

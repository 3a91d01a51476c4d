#include "linux/qt/items/Text.h"

#include <QFontDatabase>
#include <QFontMetricsF>
#include <QPainter>
#include <QStringList>
#include <QTextLayout>

#include <algorithm>
#include <cmath>
#include <limits>

namespace qtui {

namespace {

constexpr double kSmallest = 0.8;
constexpr char16_t kEllipsis = 0x2026;
/// Marks that have no width and give a line its direction: cut out of a paragraph, it may begin with words of the other.
constexpr char16_t kLeftToRight = 0x200E;
constexpr char16_t kRightToLeft = 0x200F;

constexpr char16_t kLeftToRightIsolate = 0x2066;
constexpr char16_t kRightToLeftIsolate = 0x2067;
constexpr char16_t kFirstStrongIsolate = 0x2068;
constexpr char16_t kPopDirectionalIsolate = 0x2069;

/// What opens again the isolates in which a line of `paragraph` begins at `start`, each in the direction that it has as a
/// whole: that is not to be seen in the rest of it.
QString isolatesAt(const QString& paragraph, qsizetype start)
{
    QString open;
    for (qsizetype i = 0; i < start; ++i) {
        const char16_t character = paragraph[i].unicode();
        if (character == kLeftToRightIsolate || character == kRightToLeftIsolate) {
            open += QChar(character);
        } else if (character == kFirstStrongIsolate) {
            const qsizetype end = paragraph.indexOf(QChar(kPopDirectionalIsolate), i);
            const bool isRightToLeft = paragraph.mid(i + 1, end < 0 ? -1 : end - i - 1).isRightToLeft();
            open += QChar(isRightToLeft ? kRightToLeftIsolate : kLeftToRightIsolate);
        } else if (character == kPopDirectionalIsolate) {
            open.chop(1);
        }
    }
    return open;
}

/// Where in `paragraph` its lines begin; no more of them than asked for.
std::vector<int> lineStarts(const QString& paragraph, const QFont& font, double width, std::size_t most)
{
    QTextLayout layout(paragraph, font);
    QTextOption option;
    option.setWrapMode(QTextOption::WrapAtWordBoundaryOrAnywhere);
    layout.setTextOption(option);
    std::vector<int> starts;
    layout.beginLayout();
    while (starts.size() < most) {
        QTextLine line = layout.createLine();
        if (!line.isValid())
            break;
        line.setLineWidth(width);
        starts.push_back(line.textStart());
    }
    layout.endLayout();
    return starts;
}

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

std::vector<QString> wrapped(const QString& text, const QFont& font, double width, int mostLines)
{
    const auto most = static_cast<std::size_t>(mostLines > 0 ? mostLines : std::numeric_limits<int>::max());
    const QFontMetricsF metrics(font);
    std::vector<QString> lines;
    const QStringList paragraphs = text.split(QLatin1Char('\n'));
    for (qsizetype at = 0; at < paragraphs.size() && lines.size() < most; ++at) {
        const QString& paragraph = paragraphs[at];
        const QChar mark(paragraph.isRightToLeft() ? kRightToLeft : kLeftToRight);
        // One more than fits tells whether something is left over.
        const auto starts = lineStarts(paragraph, font, width, most - lines.size() + 1);
        for (std::size_t i = 0; i < std::max<std::size_t>(1, starts.size()) && lines.size() < most; ++i) {
            const int start = starts.empty() ? 0 : starts[i];
            const bool hasNext = i + 1 < starts.size();
            const bool isLast = lines.size() + 1 == most;
            QString line = paragraph.mid(start, hasNext && !isLast ? starts[i + 1] - start : -1).trimmed();
            if (isLast && !hasNext && at + 1 < paragraphs.size())
                line += QChar(kEllipsis);
            line.prepend(mark + isolatesAt(paragraph, start));
            lines.push_back(metrics.elidedText(line, Qt::ElideRight, isLast ? width : 2 * width));
        }
    }
    return lines;
}

double lineHeight(const QFont& font)
{
    return std::ceil(QFontMetricsF(font).height());
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

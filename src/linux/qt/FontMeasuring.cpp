#include "linux/qt/FontMeasuring.h"

#include "linux/qt/items/Text.h"

#include <QFontMetricsF>
#include <QStringList>

#include <algorithm>
#include <cmath>

namespace qtui {

namespace {

QString toQString(std::string_view text)
{
    return QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
}

QFont fontOf(const platform::TextStyle& style)
{
    return systemFont(style.fontSize, style.emphasized ? QFont::DemiBold : QFont::Normal);
}

} // namespace

double FontMeasuring::widthOf(std::string_view text, const platform::TextStyle& style) const
{
    m_affinity.assertHere();
    const QFontMetricsF metrics(fontOf(style));
    double widest = 0;
    for (const QString& line : toQString(text).split(QLatin1Char('\n')))
        widest = std::max(widest, metrics.horizontalAdvance(line));
    return std::ceil(widest);
}

double FontMeasuring::heightOf(std::string_view text, const platform::TextStyle& style, double width,
                               int mostLines) const
{
    m_affinity.assertHere();
    if (text.empty() || width <= 0)
        return 0;
    const QFont font = fontOf(style);
    return lineHeight(font) * static_cast<double>(wrapped(toQString(text), font, width, mostLines).size());
}

} // namespace qtui

#include "end_to_end/Screenshot.h"

#include <algorithm>
#include <cstdlib>

namespace tests {

namespace {

constexpr int kVisible = 40; // of 255

int distance(QRgb one, QRgb other)
{
    return std::max({std::abs(qRed(one) - qRed(other)), std::abs(qGreen(one) - qGreen(other)),
                     std::abs(qBlue(one) - qBlue(other))});
}

} // namespace

QColor Screenshot::at(const Coded& coded, double x, double y) const
{
    const bool isTurned = coded.turn != Turn::None;
    const double shownWidth = isTurned ? coded.height : coded.width;
    const double shownHeight = isTurned ? coded.width : coded.height;
    const double shownX = coded.turn == Turn::Clockwise ? coded.height - y : isTurned ? y : x;
    const double shownY = coded.turn == Turn::Clockwise ? x : isTurned ? coded.width - x : y;
    const double scale = std::min(width() / shownWidth, height() / shownHeight);
    return at((width() - shownWidth * scale) / 2 + shownX * scale,
              (height() - shownHeight * scale) / 2 + shownY * scale);
}

int Screenshot::number(const Coded& coded) const
{
    const int perRow = coded.width >= 640 ? 16 : 8;
    int number = 0;
    for (int i = 0; i < 16; ++i) {
        const QColor middle = at(coded, 8 + 38 * (i % perRow) + 16, 8 + 38 * (i / perRow) + 16);
        number |= (qGray(middle.rgb()) > 125) << i;
    }
    return number;
}

bool isNear(const QColor& one, const QColor& other, int wanted)
{
    return distance(one.rgb(), other.rgb()) <= wanted;
}

std::string words(const QColor& colour)
{
    return colour.name().toStdString();
}

Difference differenceOf(const QImage& one, const QImage& other)
{
    double sum = 0;
    double visible = 0;
    for (int y = 0; y < one.height(); ++y) {
        const auto* line = reinterpret_cast<const QRgb*>(one.constScanLine(y));
        const auto* otherLine = reinterpret_cast<const QRgb*>(other.constScanLine(y));
        for (int x = 0; x < one.width(); ++x) {
            const int here = distance(line[x], otherLine[x]);
            sum += here;
            visible += here > kVisible;
        }
    }
    const double pixels = static_cast<double>(one.width()) * one.height();
    return {sum / pixels, visible / pixels};
}

} // namespace tests

#include "end_to_end/Screenshot.h"

#include <algorithm>
#include <array>
#include <cstdlib>

namespace tests {

namespace {

constexpr int kTile = 20; // pixels: about a letter

int distance(QRgb one, QRgb other)
{
    return std::max({std::abs(qRed(one) - qRed(other)), std::abs(qGreen(one) - qGreen(other)),
                     std::abs(qBlue(one) - qBlue(other))});
}

/// Red, green and blue.
std::array<double, 3> averageIn(const QImage& image, const QRect& tile)
{
    std::array<double, 3> sums{};
    for (int y = tile.top(); y <= tile.bottom(); ++y) {
        const auto* line = reinterpret_cast<const QRgb*>(image.constScanLine(y));
        for (int x = tile.left(); x <= tile.right(); ++x) {
            sums[0] += qRed(line[x]);
            sums[1] += qGreen(line[x]);
            sums[2] += qBlue(line[x]);
        }
    }
    for (double& sum : sums)
        sum /= tile.width() * tile.height();
    return sums;
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
        const int row = i / perRow;
        const QColor middle = at(coded, 24 + 38 * (i % perRow), 24 + 38 * row);
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

double differenceOf(const QImage& one, const QImage& other)
{
    double worst = 0;
    for (int top = 0; top < one.height(); top += kTile)
        for (int left = 0; left < one.width(); left += kTile) {
            const QRect tile = QRect(left, top, kTile, kTile) & one.rect();
            const auto average = averageIn(one, tile);
            const auto otherAverage = averageIn(other, tile);
            for (std::size_t i = 0; i < average.size(); ++i)
                worst = std::max(worst, std::abs(average[i] - otherAverage[i]));
        }
    return worst;
}

} // namespace tests

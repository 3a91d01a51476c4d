#include "linux/qt/items/Blur.h"

#include "linux/qt/items/VideoItem.h"

#include <QPainter>

#include <algorithm>
#include <cmath>

namespace qtui {

namespace {

/// One pixel of the blur stands for about so many points.
constexpr double kCell = 20;
constexpr double kMostCells = 64;
/// The stretch from few pixels to many is done in steps of two: each one rounds the corners that the last one left.
constexpr int kStretches = 3;

QSize cellsFor(const QSizeF& size)
{
    const auto cells = [](double points) {
        return static_cast<int>(std::clamp(std::round(points / kCell), 3.0, kMostCells));
    };
    return {cells(size.width()), cells(size.height())};
}

/// The part of a video's picture that lies in `windowRect`, averaged down to about one pixel a cell.
void paintVideo(QPainter& painter, const VideoItem& video, const QRectF& windowRect, const QSizeF& cell)
{
    const QRectF whole = video.pictureRect();
    const QRectF part = whole.intersected(windowRect);
    const QImage& picture = video.picture();
    if (part.isEmpty() || picture.isNull())
        return;
    const double scaleX = picture.width() / whole.width();
    const double scaleY = picture.height() / whole.height();
    const QRect crop = QRectF((part.left() - whole.left()) * scaleX, (part.top() - whole.top()) * scaleY,
                              part.width() * scaleX, part.height() * scaleY)
                           .toAlignedRect()
                           .intersected(picture.rect());
    const QImage cropped(picture.constScanLine(crop.top()) + std::ptrdiff_t(crop.left()) * 4, crop.width(),
                         crop.height(), picture.bytesPerLine(), picture.format());
    const QSize small(std::max(1, static_cast<int>(std::lround(part.width() / cell.width()))),
                      std::max(1, static_cast<int>(std::lround(part.height() / cell.height()))));
    painter.drawImage(part, cropped.scaled(small, Qt::IgnoreAspectRatio, Qt::SmoothTransformation));
}

} // namespace

std::vector<Blur::Source> Blur::sourcesBehind(const Stage& stage, const QRectF& windowRect)
{
    std::vector<Source> sources;
    for (const Painted& each : stage.painted) {
        const QRectF rect = each.video ? each.video->pictureRect() : each.rect;
        if (rect.intersects(windowRect))
            sources.push_back({rect, each.color.rgba(), each.video ? each.video->picture().cacheKey() : 0});
    }
    return sources;
}

bool Blur::isStale(const Stage& stage, const QRectF& windowRect, const QColor& tint) const
{
    m_affinity.assertHere();
    return m_image.isNull() || m_rect != windowRect || m_tint != tint || m_sources != sourcesBehind(stage, windowRect);
}

void Blur::update(Stage& stage, const QRectF& windowRect, const QColor& tint)
{
    m_affinity.assertHere();
    m_rect = windowRect;
    m_tint = tint;
    m_sources = sourcesBehind(stage, windowRect);
    m_image = {};
    if (windowRect.isEmpty())
        return;
    ++stage.statistics.blurs;
    const QSize cells = cellsFor(windowRect.size());
    const QSizeF cell(windowRect.width() / cells.width(), windowRect.height() / cells.height());
    QImage image(cells, QImage::Format_RGB32);
    image.fill(Qt::black);
    QPainter painter(&image);
    painter.setRenderHint(QPainter::SmoothPixmapTransform);
    painter.scale(1 / cell.width(), 1 / cell.height());
    painter.translate(-windowRect.topLeft());
    for (const Painted& each : stage.painted) {
        if (each.video)
            paintVideo(painter, *each.video, windowRect, cell);
        else
            painter.fillRect(each.rect, each.color);
    }
    painter.fillRect(windowRect, tint);
    painter.end();
    for (int i = 0; i < kStretches; ++i)
        image = image.scaled(image.size() * 2, Qt::IgnoreAspectRatio, Qt::SmoothTransformation);
    m_image = image;
}

} // namespace qtui

#include "linux/qt/items/Bitmaps.h"

#include <QPainter>

#include <memory>

namespace qtui {

QImage toQImage(const platform::ImageRef& image)
{
    if (!image || image->bitmap().width <= 0 || image->bitmap().height <= 0)
        return {};
    const platform::Bitmap& bitmap = image->bitmap();
    auto keeper = std::make_unique<platform::ImageRef>(image);
    return QImage(
        bitmap.rgba.data(), bitmap.width, bitmap.height, static_cast<qsizetype>(bitmap.width) * 4,
        QImage::Format_RGBA8888_Premultiplied, [](void* kept) { delete static_cast<platform::ImageRef*>(kept); },
        keeper.release());
}

QImage dimmed(const QImage& image, double opacity)
{
    if (image.isNull())
        return image;
    QImage result = image.convertToFormat(QImage::Format_ARGB32_Premultiplied);
    QPainter painter(&result);
    painter.setCompositionMode(QPainter::CompositionMode_DestinationIn);
    painter.fillRect(result.rect(), QColor::fromRgbF(0, 0, 0, static_cast<float>(opacity)));
    painter.end();
    return result;
}

} // namespace qtui

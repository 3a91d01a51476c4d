#include "linux/qt/SvgImageCatalog.h"

#include "linux/qt/Icons.h"

#include <cstring>

namespace qtui {

SvgImageCatalog::SvgImageCatalog(std::function<double()> scale) : m_scale(std::move(scale)) {}

platform::ImageRef SvgImageCatalog::imageNamed(std::string_view name)
{
    m_affinity.assertHere();
    const double scale = m_scale();
    const auto key = std::pair(std::string(name), scale);
    if (const auto found = m_images.find(key); found != m_images.end())
        return found->second;
    const QString path = QStringLiteral(":/clipsa/masks/%1.svg").arg(QString::fromStdString(key.first));
    const QImage drawn = renderVector(path, vectorSize(path), scale);
    if (drawn.isNull())
        return nullptr;
    const QImage rgba = drawn.convertToFormat(QImage::Format_RGBA8888_Premultiplied);
    platform::Bitmap bitmap = platform::Bitmap::transparent(rgba.width(), rgba.height());
    for (int y = 0; y < rgba.height(); ++y)
        std::memcpy(bitmap.at(0, y), rgba.constScanLine(y), static_cast<std::size_t>(rgba.width()) * 4);
    return m_images[key] = std::make_shared<const platform::Image>(std::move(bitmap), scale);
}

} // namespace qtui

#include "linux/qt/Icons.h"

#include "linux/qt/Theme.h"

#include <QFile>
#include <QPainter>
#include <QSvgRenderer>

#include <cmath>

// Outside of every namespace, as Qt asks; a static library's resources are dropped unless somebody asks for them.
static void initResources()
{
    Q_INIT_RESOURCE(clipsa);
}

namespace qtui {

void loadResources()
{
    initResources();
}

QSizeF vectorSize(const QString& path)
{
    loadResources();
    if (!QFile::exists(path))
        return {};
    const QSvgRenderer renderer(path);
    return renderer.isValid() ? QSizeF(renderer.defaultSize()) : QSizeF();
}

QImage renderVector(const QString& path, QSizeF size, double scale)
{
    loadResources();
    if (!QFile::exists(path))
        return {};
    QSvgRenderer renderer(path);
    if (!renderer.isValid())
        return {};
    QImage image(static_cast<int>(std::ceil(size.width() * scale)), static_cast<int>(std::ceil(size.height() * scale)),
                 QImage::Format_ARGB32_Premultiplied);
    image.fill(Qt::transparent);
    QPainter painter(&image);
    painter.setRenderHint(QPainter::Antialiasing);
    renderer.render(&painter, QRectF(QPointF(), size * scale));
    painter.end();
    return image;
}

QImage Icons::glyph(const std::string& name, const QColor& color, double scale)
{
    m_affinity.assertHere();
    QImage& glyph = m_glyphs[{name, color.rgba(), scale}];
    if (!glyph.isNull())
        return glyph;
    const QString path = QStringLiteral(":/clipsa/icons/%1.svg").arg(QString::fromStdString(name));
    glyph = renderVector(path, {metrics::kGlyphSize, metrics::kGlyphSize}, scale);
    if (glyph.isNull()) {
        qWarning("No glyph is called \"%s\"", name.c_str());
        glyph = QImage(1, 1, QImage::Format_ARGB32_Premultiplied);
        glyph.fill(Qt::transparent);
        return glyph;
    }
    QPainter painter(&glyph);
    painter.setCompositionMode(QPainter::CompositionMode_SourceIn);
    painter.fillRect(glyph.rect(), color);
    painter.end();
    return glyph;
}

} // namespace qtui

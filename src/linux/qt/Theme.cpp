#include "linux/qt/Theme.h"

#include <QGuiApplication>
#include <QPalette>

#include <algorithm>

namespace qtui {

Scheme systemScheme()
{
    const QPalette palette = QGuiApplication::palette();
    const bool dark = palette.color(QPalette::Window).lightness() < palette.color(QPalette::WindowText).lightness();
    return dark ? Scheme::Dark : Scheme::Light;
}

QColor toQColor(const platform::Color& color)
{
    const auto part = [](double value) { return static_cast<float>(std::clamp(value, 0.0, 1.0)); };
    return QColor::fromRgbF(part(color.red), part(color.green), part(color.blue), part(color.alpha));
}

Theme Theme::forScheme(Scheme scheme)
{
    Theme theme;
    theme.scheme = scheme;
    const bool dark = scheme == Scheme::Dark;
    theme.text = dark ? QColor(0xF2, 0xF2, 0xF5) : QColor(0x0B, 0x0B, 0x0E);
    theme.accent = dark ? QColor(0x9D, 0xBB, 0xFF) : QColor(0x1F, 0x4F, 0xD1);
    theme.destructive = dark ? QColor(0xFF, 0x9A, 0x90) : QColor(0xB3, 0x26, 0x1E);
    theme.surface = dark ? QColor(0x28, 0x28, 0x2E) : QColor(0xFC, 0xFC, 0xFE);
    theme.edge = dark ? QColor(255, 255, 255, 48) : QColor(0, 0, 0, 40);
    theme.shadow = QColor(0, 0, 0, dark ? 16 : 7);
    theme.pressed = dark ? QColor(255, 255, 255, 30) : QColor(0, 0, 0, 20);
    theme.mark = dark ? QColor(255, 255, 255, 112) : QColor(0, 0, 0, 112);
    theme.track = dark ? QColor(255, 255, 255, 52) : QColor(0, 0, 0, 40);
    theme.bar = dark ? QColor(0x1B, 0x1B, 0x20, 222) : QColor(0xFA, 0xFA, 0xFC, 232);
    theme.chrome = dark ? QColor(0x1B, 0x1B, 0x20, 168) : QColor(0xF4, 0xF4, 0xF8, 180);
    theme.disc = QColor(0xFF, 0xFF, 0xFF, 150);
    theme.hairline = dark ? QColor(255, 255, 255, 40) : QColor(0, 0, 0, 46);
    theme.trim = dark ? QColor(0xFF, 0xCF, 0x40) : QColor(0xFB, 0xBF, 0x24);
    theme.trimMark = QColor(0x2E, 0x22, 0x00);
    theme.trimOutline = dark ? QColor(0, 0, 0, 90) : QColor(0x4A, 0x36, 0x00, 150);
    theme.focusRing = dark ? QColor(0x9D, 0xBB, 0xFF) : QColor(0x1F, 0x4F, 0xD1);
    theme.focusContrast = dark ? QColor(0x0B, 0x0B, 0x0E, 200) : QColor(255, 255, 255, 230);
    return theme;
}

QColor Theme::label(const platform::Color& color) const
{
    const bool black = color.red == 0 && color.green == 0 && color.blue == 0;
    if (!black)
        return toQColor(color);
    QColor adapted = text;
    adapted.setAlphaF(static_cast<float>(color.alpha));
    return adapted;
}

} // namespace qtui

/// The platform's pictures as Qt's. Any thread.
#pragma once

#include "platform/views/Image.h"

#include <QImage>

namespace qtui {

/// Looks at the picture's own memory, and keeps the picture alive for as long as the result lives.
QImage toQImage(const platform::ImageRef& image);

/// A copy with less opacity.
QImage dimmed(const QImage& image, double opacity);

} // namespace qtui

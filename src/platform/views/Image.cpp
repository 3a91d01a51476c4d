#include "platform/views/Image.h"

namespace platform {

Bitmap Bitmap::transparent(int width, int height)
{
    Bitmap bitmap;
    bitmap.width = width > 0 ? width : 0;
    bitmap.height = height > 0 ? height : 0;
    bitmap.rgba.assign(static_cast<std::size_t>(bitmap.width) * static_cast<std::size_t>(bitmap.height) * 4, 0);
    return bitmap;
}

} // namespace platform

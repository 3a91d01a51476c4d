#include "platform/views/ImageView.h"

#include <utility>

namespace platform {

ImageView::ImageView(ImageRef image)
    : View(image ? base::Rect{{}, image->size()} : base::Rect{}), m_image(std::move(image))
{
}

const runtime::Class& ImageView::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<ImageView>("ImageView", &View::classObject()).build();
    return instance;
}

const runtime::Class& ImageView::isa() const
{
    return classObject();
}

} // namespace platform

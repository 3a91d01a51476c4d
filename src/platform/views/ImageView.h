/// A picture as a view, as large as its image at first. Main queue only.
#pragma once

#include "platform/views/Image.h"
#include "platform/views/View.h"

namespace platform {

class ImageView final : public View {
public:
    explicit ImageView(ImageRef image);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    const ImageRef& image() const { return here(m_image); }

private:
    ImageRef m_image;
};

} // namespace platform

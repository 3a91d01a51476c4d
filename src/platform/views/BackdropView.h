/// A live, blurred, translucent view of what lies behind it. Mask views give it a shape. Main queue only.
#pragma once

#include "platform/views/View.h"

namespace platform {

/// A view marked with these flags (`View::setBackdropMaskFlags`) takes part in the mask of a backdrop.
enum BackdropMask : unsigned {
    kBackdropMaskGrayscale = 1U << 0U, ///< where the mask is transparent, the blur shows undarkened
    kBackdropMaskColor = 1U << 1U, ///< where the mask is opaque, the blur shows darkened, so that a glyph stands out
    kBackdropMaskShape = 1U << 2U, ///< nothing of the backdrop shows where the mask is opaque
};

class BackdropView final : public View {
public:
    /// The translucent strip and disc of the player's chrome.
    static constexpr int kStyleChrome = 2010;

    explicit BackdropView(int style, base::Rect frame = {});

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    int style() const { return here(m_style); }

    /// Takes `view` (a subview of this view's superview) into the mask, or out of it when it carries no flags.
    void updateMaskViewsFor(const std::shared_ptr<View>& view);
    std::vector<std::shared_ptr<View>> maskViews() const;

private:
    int m_style;
    std::vector<std::weak_ptr<View>> m_maskViews;
};

} // namespace platform

/// A control with an image, a glyph or a title, which can differ by state. Main queue only.
#pragma once

#include "platform/views/Control.h"
#include "platform/views/Image.h"

#include <string>

namespace platform {

class Button : public Control {
public:
    enum class State { Normal, Highlighted };

    using Control::Control;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    void setImage(ImageRef image, State state);
    ImageRef image(State state) const;
    /// The highlighted image while pressed, where there is one; else the normal one.
    ImageRef currentImage() const;

    /// A glyph of the presenter's icon set, drawn sharp at any scale in the tint colour: "play", "pause", "share".
    void setGlyph(std::string name);
    const std::string& glyph() const { return here(m_glyph); }
    /// Moves the glyph inside the button.
    void setImageInsets(base::EdgeInsets insets);
    base::EdgeInsets imageInsets() const { return here(m_imageInsets); }

    void setTitle(std::string title);
    const std::string& title() const { return here(m_title); }
    /// A bold title marks what confirms.
    void setEmphasized(bool emphasized);
    bool isEmphasized() const { return here(m_emphasized); }
    /// A title in the colour of warning marks what cannot be taken back.
    void setDestructive(bool destructive);
    bool isDestructive() const { return here(m_destructive); }

    base::Size sizeThatFits() const override;
    bool activate() override;
    Accessibility accessibility() const override;

private:
    ImageRef m_normalImage;
    ImageRef m_highlightedImage;
    std::string m_glyph;
    std::string m_title;
    base::EdgeInsets m_imageInsets;
    bool m_emphasized = false;
    bool m_destructive = false;
};

} // namespace platform

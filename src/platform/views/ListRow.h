/// A button that is a row of a list: a glyph or an image where rows begin, and a title beside it, on up to two lines.
/// Main queue only.
#pragma once

#include "platform/views/Button.h"

namespace platform {

class ListRow final : public Button {
public:
    static constexpr double kHeight = 56;
    /// The square that holds the glyph or the image, and where it begins.
    static constexpr double kIconSize = 28;
    static constexpr double kMargin = 16;
    /// Where the title begins.
    static constexpr double kTitleStart = kMargin + kIconSize + 16;

    using Button::Button;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// Kept free where the row ends, for what stands on it there; the title takes one line beside it.
    double trailingInset() const { return here(m_trailingInset); }
    void setTrailingInset(double inset);

    /// It does what it is for: it looks as one that can be pressed, though it cannot.
    bool isBusy() const { return here(m_busy); }
    void setBusy(bool busy);

private:
    bool m_busy = false;
    double m_trailingInset = 0;
};

} // namespace platform

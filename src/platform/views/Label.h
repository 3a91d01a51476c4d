/// One line of text in the system font. Main queue only.
#pragma once

#include "platform/views/View.h"

#include <string>

namespace platform {

enum class TextAlignment { Left, Center, Right };

class Label final : public View {
public:
    using View::View;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    const std::string& text() const { return here(m_text); }
    void setText(std::string text);
    /// In points.
    double fontSize() const { return here(m_fontSize); }
    void setFontSize(double points);
    Color textColor() const { return here(m_textColor); }
    void setTextColor(Color color);
    TextAlignment textAlignment() const { return here(m_alignment); }
    void setTextAlignment(TextAlignment alignment);

    Accessibility accessibility() const override;

private:
    std::string m_text;
    double m_fontSize = 17;
    Color m_textColor = Color::black();
    TextAlignment m_alignment = TextAlignment::Left;
};

} // namespace platform

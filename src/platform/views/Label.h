/// Text in the system font: one line, or several that wrap. Main queue only.
///
/// One line stands in the middle of the frame's height, several begin at its top. What does not fit ends in an ellipsis.
#pragma once

#include "platform/views/TextMeasuring.h"
#include "platform/views/View.h"

#include <string>

namespace platform {

/// `Leading` is where the window's rows begin: left, or right where words run from right to left.
enum class TextAlignment { Left, Center, Right, Leading };

class Label final : public View {
public:
    using View::View;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    const std::string& text() const { return here(m_text); }
    void setText(std::string text);
    /// In points.
    double fontSize() const { return here(m_style).fontSize; }
    void setFontSize(double points);
    /// A bold text marks what a surface is about.
    bool isEmphasized() const { return here(m_style).emphasized; }
    void setEmphasized(bool emphasized);
    Color textColor() const { return here(m_textColor); }
    void setTextColor(Color color);
    TextAlignment textAlignment() const { return here(m_alignment); }
    void setTextAlignment(TextAlignment alignment);
    /// The most lines that it may take; 0 means any number. 1 at first.
    int numberOfLines() const { return here(m_lines); }
    void setNumberOfLines(int lines);

    /// What its text takes in the presenter's fonts.
    double widthThatFits() const;
    double heightThatFits(double width) const;

    Accessibility accessibility() const override;

private:
    std::string m_text;
    TextStyle m_style;
    Color m_textColor = Color::black();
    TextAlignment m_alignment = TextAlignment::Left;
    int m_lines = 1;
};

} // namespace platform

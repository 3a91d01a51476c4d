#include "platform/views/Label.h"

#include "platform/views/Window.h"

#include <utility>

namespace platform {

const runtime::Class& Label::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<Label>("Label", &View::classObject()).build();
    return instance;
}

const runtime::Class& Label::isa() const
{
    return classObject();
}

void Label::setText(std::string text)
{
    assertHere();
    if (m_text == text)
        return;
    m_text = std::move(text);
    setNeedsDisplay();
}

void Label::setFontSize(double points)
{
    assertHere();
    if (m_style.fontSize == points)
        return;
    m_style.fontSize = points;
    setNeedsDisplay();
}

void Label::setEmphasized(bool emphasized)
{
    assertHere();
    if (m_style.emphasized == emphasized)
        return;
    m_style.emphasized = emphasized;
    setNeedsDisplay();
}

void Label::setNumberOfLines(int lines)
{
    assertHere();
    if (m_lines == lines)
        return;
    m_lines = lines;
    setNeedsDisplay();
}

double Label::widthThatFits() const
{
    assertHere();
    return textMeasuringFor(*this).widthOf(m_text, m_style);
}

double Label::heightThatFits(double width) const
{
    assertHere();
    return textMeasuringFor(*this).heightOf(m_text, m_style, width, m_lines);
}

void Label::setTextColor(Color color)
{
    assertHere();
    if (m_textColor == color)
        return;
    m_textColor = color;
    setNeedsDisplay();
}

void Label::setTextAlignment(TextAlignment alignment)
{
    assertHere();
    if (m_alignment == alignment)
        return;
    m_alignment = alignment;
    setNeedsDisplay();
}

Accessibility Label::accessibility() const
{
    assertHere();
    Accessibility description = View::accessibility();
    description.role = AccessibilityRole::Label;
    if (description.name.empty())
        description.name = m_text;
    description.value = m_text;
    return description;
}

} // namespace platform

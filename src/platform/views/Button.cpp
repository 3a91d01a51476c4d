#include "platform/views/Button.h"

#include "platform/views/TextMeasuring.h"

#include <algorithm>
#include <utility>

namespace platform {

namespace {

constexpr double kTouchSize = 44;
constexpr double kFontSize = 17;
constexpr double kTitlePadding = 16;

} // namespace

const runtime::Class& Button::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<Button>("Button", &Control::classObject()).build();
    return instance;
}

const runtime::Class& Button::isa() const
{
    return classObject();
}

void Button::setImage(ImageRef image, State state)
{
    assertHere();
    ImageRef& place = state == State::Normal ? m_normalImage : m_highlightedImage;
    if (place == image)
        return;
    place = std::move(image);
    setNeedsDisplay();
}

ImageRef Button::image(State state) const
{
    assertHere();
    return state == State::Normal ? m_normalImage : m_highlightedImage;
}

ImageRef Button::currentImage() const
{
    assertHere();
    return isHighlighted() && m_highlightedImage ? m_highlightedImage : m_normalImage;
}

void Button::setGlyph(std::string name)
{
    assertHere();
    if (m_glyph == name)
        return;
    m_glyph = std::move(name);
    setNeedsDisplay();
}

void Button::setImageInsets(base::EdgeInsets insets)
{
    assertHere();
    if (m_imageInsets == insets)
        return;
    m_imageInsets = insets;
    setNeedsDisplay();
}

void Button::setTitle(std::string title)
{
    assertHere();
    if (m_title == title)
        return;
    m_title = std::move(title);
    setNeedsDisplay();
}

void Button::setEmphasized(bool emphasized)
{
    assertHere();
    if (m_emphasized == emphasized)
        return;
    m_emphasized = emphasized;
    setNeedsDisplay();
}

base::Size Button::sizeThatFits() const
{
    assertHere();
    if (m_normalImage)
        return m_normalImage->size();
    if (!m_glyph.empty())
        return {kTouchSize, kTouchSize};
    if (m_title.empty())
        return View::sizeThatFits();
    // An estimate: bars ask before their items are in a window.
    return {std::max(kTouchSize, EstimatedText().widthOf(m_title, {kFontSize, m_emphasized}) + kTitlePadding),
            kTouchSize};
}

void Button::setDestructive(bool destructive)
{
    assertHere();
    if (m_destructive == destructive)
        return;
    m_destructive = destructive;
    setNeedsDisplay();
}

bool Button::activate()
{
    assertHere();
    if (!isEnabled())
        return false;
    const auto keepAlive = shared_from_this();
    sendActionsFor(kTouchDown);
    sendActionsFor(kTouchUpInside);
    return true;
}

Accessibility Button::accessibility() const
{
    assertHere();
    Accessibility description = View::accessibility();
    description.role = AccessibilityRole::Button;
    if (description.name.empty())
        description.name = m_title;
    description.enabled = isEnabled();
    return description;
}

} // namespace platform

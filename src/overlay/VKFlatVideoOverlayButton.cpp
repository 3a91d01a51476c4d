#include "overlay/VKFlatVideoOverlayButton.h"

#include "base/Once.h"
#include "platform/views/Canvas.h"

using platform::BlendMode;
using platform::ImageRef;
using runtime::Selector;

std::shared_ptr<VKFlatVideoOverlayButton> VKFlatVideoOverlayButton::initWithStyle(const platform::Platform& platform,
                                                                                  std::int64_t style)
{
    const std::shared_ptr<VKFlatVideoOverlayButton> button(new VKFlatVideoOverlayButton);
    button->m_style = style;
    button->setImage(_normalButtonImage(platform), State::Normal);
    button->setImage(_highlightedButtonImage(platform), State::Highlighted);
    button->setAccessibilityLabel(platform.words.text("OVERLAY_PLAY"));
    button->sizeToFit();
    button->setPassesTouchesToSuperviewRecognizers(false);
    button->addTarget(button, Selector("_handleTap:"), platform::kTouchUpInside);
    return button;
}

const runtime::Class& VKFlatVideoOverlayButton::classObject()
{
    using Self = VKFlatVideoOverlayButton;
    static const runtime::Class& instance =
        runtime::ClassBuilder<Self>("VKFlatVideoOverlayButton", &Button::classObject())
            .method("_handleTap:", &Self::_handleTap)
            .instanceVariable("_style", &Self::m_style)
            .instanceVariable("_target", &Self::m_target)
            .instanceVariable("_action", &Self::m_action)
            .build();
    return instance;
}

void VKFlatVideoOverlayButton::setTarget_action(const std::weak_ptr<runtime::Object>& target, const Selector& action)
{
    assertHere();
    setTarget(target);
    setAction(action);
}

void VKFlatVideoOverlayButton::_handleTap(const std::shared_ptr<runtime::Object>& /*sender*/)
{
    assertHere();
    runtime::TargetAction(m_target, m_action).send(shared_from_this());
}

ImageRef VKFlatVideoOverlayButton::_normalButtonImage(const platform::Platform& platform)
{
    static base::Once<ImageRef> image;
    return image.get([&] {
        return _createOverlayImageWithBackgroundWhite_backgroundAlpha_glyphAlpha(
            platform, VKVideoOverlayFlatBackgroundWhite, VKVideoOverlayFlatBackgroundAlpha,
            VKVideoOverlayDefaultGlyphAlpha);
    });
}

ImageRef VKFlatVideoOverlayButton::_highlightedButtonImage(const platform::Platform& platform)
{
    static base::Once<ImageRef> image;
    return image.get([&] {
        return _createOverlayImageWithBackgroundWhite_backgroundAlpha_glyphAlpha(
            platform, VKVideoOverlayFlatBackgroundWhite, VKVideoOverlayFlatBackgroundAlpha,
            VKVideoOverlayHighlightedGlyphAlpha);
    });
}

ImageRef VKFlatVideoOverlayButton::_createOverlayImageWithBackgroundWhite_backgroundAlpha_glyphAlpha(
    const platform::Platform& platform, double backgroundWhite, double backgroundAlpha, double glyphAlpha)
{
    const ImageRef disc = platform.images.imageNamed(VKVideoOverlayBackgroundMaskImageName);
    const ImageRef glyph = platform.images.imageNamed(VKVideoOverlayGlyphMaskImageName);
    if (!disc || !glyph)
        return nullptr;

    platform::Canvas canvas(disc->size(), platform.mainScreen.scale());
    canvas.fill({{0, 0}, disc->size()}, backgroundWhite, backgroundAlpha);
    for (const ImageRef& mask : {disc, glyph})
        canvas.draw(*mask, {0, 0}, BlendMode::DestinationOut, 1.0);
    canvas.draw(*glyph, {0, 0}, BlendMode::SourceOver, glyphAlpha);
    return canvas.image();
}

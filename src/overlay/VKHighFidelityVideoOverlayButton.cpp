#include "overlay/VKHighFidelityVideoOverlayButton.h"

#include "platform/views/ImageView.h"

using platform::BackdropView;
using platform::Button;
using platform::ImageRef;
using platform::ImageView;
using runtime::Selector;

std::shared_ptr<VKHighFidelityVideoOverlayButton>
VKHighFidelityVideoOverlayButton::initWithStyle(const platform::Platform& platform, std::int64_t style)
{
    const auto button = std::make_shared<Button>();
    button->setImage(platform.images.imageNamed(VKVideoOverlayGlyphMaskImageName), Button::State::Normal);
    button->setAccessibilityLabel(platform.words.text("OVERLAY_PLAY"));
    button->sizeToFit();

    const std::shared_ptr<VKHighFidelityVideoOverlayButton> view(new VKHighFidelityVideoOverlayButton(button->frame()));
    view->m_style = style;
    view->m_button = button;
    button->addTarget(view, Selector("_playButtonTapped:"), platform::kTouchUpInside);
    button->addTarget(view, Selector("_playButtonActivate:"), platform::kTouchDown);
    button->addTarget(view, Selector("_playButtonActivate:"), platform::kTouchDragInside);
    button->addTarget(view, Selector("_playButtonDeactivate:"), platform::kTouchDragOutside);
    // A tap on the button must not also be a tap on the movie, which would hide the chrome.
    button->setPassesTouchesToSuperviewRecognizers(false);
    view->addSubview(button);
    view->setAutoresizingMask(platform::kFlexibleLeftMargin | platform::kFlexibleRightMargin
                              | platform::kFlexibleTopMargin | platform::kFlexibleBottomMargin);
    if (style == kStyleAutomatic)
        view->addBackdrop(platform);
    view->_playButtonDeactivate(nullptr);
    return view;
}

void VKHighFidelityVideoOverlayButton::addBackdrop(const platform::Platform& platform)
{
    const ImageRef disc = platform.images.imageNamed(VKVideoOverlayBackgroundMaskImageName);
    const auto mask = std::make_shared<ImageView>(disc);
    m_backdropView = std::make_shared<BackdropView>(BackdropView::kStyleChrome);
    insertSubview_belowSubview(m_backdropView, m_button);
    addSubview(mask);

    // The disc cuts the backdrop's shape and is not drawn itself; the glyph stands out of it.
    mask->setBackdropMaskFlags(platform::kBackdropMaskGrayscale | platform::kBackdropMaskColor
                               | platform::kBackdropMaskShape);
    mask->setAlpha(0.0);
    m_backdropView->updateMaskViewsFor(mask);
    m_button->setBackdropMaskFlags(platform::kBackdropMaskGrayscale | platform::kBackdropMaskColor);
    m_backdropView->updateMaskViewsFor(m_button);
}

const runtime::Class& VKHighFidelityVideoOverlayButton::classObject()
{
    using Self = VKHighFidelityVideoOverlayButton;
    static const runtime::Class& instance =
        runtime::ClassBuilder<Self>("VKHighFidelityVideoOverlayButton", &View::classObject())
            .method("_playButtonActivate:", &Self::_playButtonActivate)
            .method("_playButtonDeactivate:", &Self::_playButtonDeactivate)
            .method("_playButtonTapped:", &Self::_playButtonTapped)
            .instanceVariable("_style", &Self::m_style)
            .instanceVariable("_button", &Self::m_button)
            .instanceVariable("_backdropView", &Self::m_backdropView)
            .instanceVariable("_target", &Self::m_target)
            .instanceVariable("_action", &Self::m_action)
            .build();
    return instance;
}

void VKHighFidelityVideoOverlayButton::setTarget_action(const std::weak_ptr<runtime::Object>& target,
                                                        const Selector& action)
{
    assertHere();
    setTarget(target);
    setAction(action);
}

void VKHighFidelityVideoOverlayButton::_playButtonActivate(const std::shared_ptr<runtime::Object>& /*sender*/)
{
    assertHere();
    m_button->setAlpha(VKVideoOverlayHighlightedGlyphAlpha);
}

void VKHighFidelityVideoOverlayButton::_playButtonDeactivate(const std::shared_ptr<runtime::Object>& /*sender*/)
{
    assertHere();
    m_button->setAlpha(VKVideoOverlayDefaultGlyphAlpha);
}

void VKHighFidelityVideoOverlayButton::_playButtonTapped(const std::shared_ptr<runtime::Object>& sender)
{
    assertHere();
    _playButtonDeactivate(sender);
    runtime::TargetAction(m_target, m_action).send(shared_from_this());
}

// The two arrangements of the chrome: two bars on a phone held upright, one bar wherever the view is wide.

#include "editor/VKVideoEditorViewController.h"

using platform::InterfaceIdiom;
using platform::LayoutAttribute;

namespace {

// Bar heights in points, with a home button and without.
constexpr double kTopBarHeight = 60;
constexpr double kTopBarHeightWithoutHomeButton = 85;
constexpr double kBottomBarHeight = 44;
constexpr double kBottomBarHeightWithoutHomeButton = 64;

constexpr double kStripHeight = 38; // points

// In the taller top bar the glyphs move down to the line of the title.
constexpr base::EdgeInsets kNoInsets{0, 0, -0.0, 0};
constexpr base::EdgeInsets kPadPlayInsets{8, 0, -8, 0};
constexpr base::EdgeInsets kPadShareInsets{5, 0, -5, 0};

} // namespace

base::Rect VKVideoEditorViewController::topToolBarFrame()
{
    return base::Rect::make(0, 0, view()->bounds().width(),
                            hasHomeButton() ? kTopBarHeight : kTopBarHeightWithoutHomeButton);
}

base::Rect VKVideoEditorViewController::bottomToolBarFrame()
{
    const base::Size size = view()->bounds().size;
    const double height = hasHomeButton() ? kBottomBarHeight : kBottomBarHeightWithoutHomeButton;
    return base::Rect::make(0, size.height - height, size.width, height);
}

void VKVideoEditorViewController::applyLayoutForDevice()
{
    const bool pad = m_platform.device.userInterfaceIdiom() == InterfaceIdiom::Pad;
    if (pad || currentOrientation() == 1)
        applyPadUILayout();
    else
        applyPhoneUILayout();
}

void VKVideoEditorViewController::viewWillTransitionToSize_withTransitionCoordinator(
    base::Size size, platform::TransitionCoordinator& coordinator)
{
    assertHere();
    ViewController::viewWillTransitionToSize_withTransitionCoordinator(size, coordinator);
    coordinator.animateAlongsideTransition(
        [weak = weakSelf<VKVideoEditorViewController>()] {
            const auto self = weak.lock();
            if (!self)
                return;
            self->topToolBar()->setItems({});
            self->bottomToolBar()->setItems({});
            self->refreshAVRotation();
            self->applyLayoutForDevice();
            self->centreVideoOverlayPlayButton();
        },
        {});
}

void VKVideoEditorViewController::centreVideoOverlayPlayButton()
{
    const auto button = videoOverlayPlayButton()->asView();
    const base::Size screen = m_platform.mainScreen.bounds().size;
    const base::Size size = button->frame().size;
    button->setFrame({{screen.width * 0.5 - size.width * 0.5, screen.height * 0.5 - size.height * 0.5}, size});
}

void VKVideoEditorViewController::applyPhoneUILayout()
{
    assertHere();
    playButton()->setImageInsets(kNoInsets);
    pauseButton()->setImageInsets(kNoInsets);
    shareButton()->setImageInsets(kNoInsets);
    if (isTrimming()) {
        topToolBar()->setItems({cancelTrimButton(), flexSpace(), titleButton(), flexSpace(), trimButton()});
        bottomToolBar()->setItems({flexSpace(), playButton(), flexSpace()});
    } else {
        // Until the first play, the large play button is the way to start.
        if (isIntroMode())
            bottomToolBar()->setItems({shareButton(), flexSpace()});
        else
            bottomToolBar()->setItems({shareButton(), flexSpace(), playButton(), flexSpace()});
        topToolBar()->setItems({cancelButton(), flexSpace(), titleButton(), flexSpace(), saveButton()});
    }
    view()->addSubview(bottomToolBar());
    applyPhoneConstraints();
    setPadMode(false);
}

void VKVideoEditorViewController::applyPadUILayout()
{
    assertHere();
    playButton()->setImageInsets(kPadPlayInsets);
    pauseButton()->setImageInsets(kPadPlayInsets);
    shareButton()->setImageInsets(kPadShareInsets);
    if (isTrimming()) {
        topToolBar()->setItems(
            {cancelTrimButton(), flexSpace(), titleButton(), flexSpace(), playButton(), fixSpace(), trimButton()});
    } else if (isIntroMode()) {
        topToolBar()->setItems(
            {cancelButton(), flexSpace(), titleButton(), flexSpace(), shareButton(), fixSpace(), saveButton()});
    } else {
        topToolBar()->setItems({cancelButton(), flexSpace(), titleButton(), flexSpace(), playButton(), fixSpace(),
                                shareButton(), fixSpace(), saveButton()});
    }
    bottomToolBar()->removeFromSuperview();
    applyPadConstraints();
    setPadMode(true);
}

// Constraints are only ever added. Removing the bottom bar drops those that refer to it; where an older set and a newer
// one disagree, the layout engine breaks the older.

void VKVideoEditorViewController::applyPhoneConstraints()
{
    assertHere();
    addStripConstraint(LayoutAttribute::Leading, view(), LayoutAttribute::Leading);
    addStripConstraint(LayoutAttribute::Trailing, view(), LayoutAttribute::Trailing);
    addStripConstraint(LayoutAttribute::Bottom, bottomToolBar(), LayoutAttribute::Top);
    addStripConstraint(LayoutAttribute::Height, nullptr, LayoutAttribute::None);
}

void VKVideoEditorViewController::applyPadConstraints()
{
    assertHere();
    addStripConstraint(LayoutAttribute::Leading, view(), LayoutAttribute::Leading);
    addStripConstraint(LayoutAttribute::Trailing, view(), LayoutAttribute::Trailing);
    addStripConstraint(LayoutAttribute::Bottom, view(), LayoutAttribute::Bottom);
    addStripConstraint(LayoutAttribute::Height, nullptr, LayoutAttribute::None);
}

void VKVideoEditorViewController::addStripConstraint(LayoutAttribute attribute,
                                                     const std::shared_ptr<platform::View>& other,
                                                     LayoutAttribute otherAttribute)
{
    view()->addConstraint({scrubberContainterView(), attribute, other, otherAttribute, 1.0, other ? 0 : kStripHeight});
}

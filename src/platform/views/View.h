/// A rectangle of the screen with an opacity, a place among its siblings, and children. Main queue only.
///
/// Values are the model: they change at once. Inside `animate()` a change is also noted as an animation, which the
/// presenter plays; nobody here waits for it. The tree owns downwards; every reference upwards is weak.
#pragma once

#include "base/Geometry.h"
#include "platform/views/Accessibility.h"
#include "platform/views/Animation.h"
#include "platform/views/Color.h"
#include "platform/views/Layer.h"
#include "platform/views/LayoutConstraint.h"
#include "platform/views/Responder.h"
#include "platform/views/Touch.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace platform {

class GestureRecognizer;
class ViewController;

/// How a view follows the size of its superview. The flexible parts share the change in proportion to their size.
enum Autoresizing : unsigned {
    kAutoresizingNone = 0,
    kFlexibleLeftMargin = 1U << 0U,
    kFlexibleWidth = 1U << 1U,
    kFlexibleRightMargin = 1U << 2U,
    kFlexibleTopMargin = 1U << 3U,
    kFlexibleHeight = 1U << 4U,
    kFlexibleBottomMargin = 1U << 5U,
};

class View : public Responder {
public:
    /// What a view draws on: other views and bare layers, back to front.
    using Child = std::variant<std::shared_ptr<View>, std::shared_ptr<Layer>>;

    explicit View(base::Rect frame = {});
    ~View() override;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    // Geometry: the frame is in the superview's coordinates, the bounds in its own.
    base::Rect frame() const { return here(m_frame); }
    void setFrame(base::Rect frame);
    base::Rect bounds() const { return {{0, 0}, here(m_frame).size}; }
    base::Point center() const { return here(m_frame).center(); }
    void setCenter(base::Point center);
    unsigned autoresizingMask() const { return here(m_autoresizingMask); }
    void setAutoresizingMask(unsigned mask) { here(m_autoresizingMask) = mask; }
    /// What it would like to be; the current size by default.
    virtual base::Size sizeThatFits() const { return here(m_frame).size; }
    void sizeToFit();
    base::Point convertToRoot(base::Point point) const;
    base::Point convertFromRoot(base::Point point) const;

    // Looks.
    double alpha() const { return here(m_alpha); }
    void setAlpha(double alpha);
    bool isHidden() const { return here(m_hidden); }
    void setHidden(bool hidden);
    Color backgroundColor() const { return here(m_backgroundColor); }
    void setBackgroundColor(Color color);
    bool clipsToBounds() const { return here(m_clipsToBounds); }
    void setClipsToBounds(bool clips);
    /// Nothing means: the superview's, and in the end the presenter's accent colour.
    std::optional<Color> tintColor() const { return here(m_tintColor); }
    void setTintColor(std::optional<Color> color);
    std::optional<Color> effectiveTintColor() const;

    // The tree.
    const std::vector<Child>& children() const { return here(m_children); }
    std::vector<std::shared_ptr<View>> subviews() const;
    std::shared_ptr<View> superview() const { return here(m_superview).lock(); }
    /// Adding a view that is already here brings it to the front.
    void addSubview(const std::shared_ptr<View>& view);
    void insertSubview_belowSubview(const std::shared_ptr<View>& view, const std::shared_ptr<View>& sibling);
    void addSublayer(const std::shared_ptr<Layer>& layer);
    void removeFromSuperview();
    bool isDescendantOf(const View& ancestor) const;
    std::shared_ptr<Window> window() const override;
    std::shared_ptr<Responder> nextResponder() const override;

    // Layout by constraints: every constraint between this view and views below it is kept here.
    bool translatesAutoresizingMaskIntoConstraints() const { return here(m_translatesAutoresizing); }
    void setTranslatesAutoresizingMaskIntoConstraints(bool translates);
    /// A constraint equal to one that is kept already is not kept twice: it only becomes the newest.
    void addConstraint(const LayoutConstraint& constraint);
    const std::vector<LayoutConstraint>& constraints() const { return here(m_constraints); }
    /// Marks this view for layout before the next picture.
    void setNeedsLayout();
    bool needsLayout() const { return here(m_needsLayout); }
    /// Lays out this view and everything below it that is marked, now.
    void layoutIfNeeded();
    /// Solves the constraints kept here and places the subviews. Overriders call this first.
    virtual void layoutSubviews();

    // Touch.
    bool isUserInteractionEnabled() const { return here(m_userInteractionEnabled); }
    void setUserInteractionEnabled(bool enabled) { here(m_userInteractionEnabled) = enabled; }
    /// The frontmost view below `point` (own coordinates) that takes touches; null outside, hidden or below alpha 0.01.
    virtual std::shared_ptr<View> hitTest(base::Point point);
    virtual bool pointInside(base::Point point) const { return bounds().contains(point); }
    void addGestureRecognizer(const std::shared_ptr<GestureRecognizer>& recognizer);
    const std::vector<std::shared_ptr<GestureRecognizer>>& gestureRecognizers() const { return here(m_recognizers); }
    /// Whether touches that begin here may also reach the recognisers of views above.
    virtual bool passesTouchesToSuperviewRecognizers() const { return true; }
    virtual void touchBegan(const Touch&) {}
    virtual void touchMoved(const Touch&) {}
    virtual void touchEnded(const Touch&) {}
    virtual void touchCancelled(const Touch&) {}
    /// Moves what is shown by so many points, up if positive; false when it does not scroll, or is at its end.
    virtual bool scrollBy(double /*points*/) { return false; }
    /// Scrolls so that `view`, which stands below this, can be seen.
    virtual void reveal(const View& /*view*/) {}

    // Keyboard focus and assistive technology.
    virtual bool canBecomeFocused() const { return false; }
    /// What Return or Space does to a focused view, and "press" of assistive technology; false when nothing.
    virtual bool activate() { return false; }
    /// What an arrow key does to a focused view, to the right if positive; false when nothing.
    virtual bool adjust(int /*steps*/) { return false; }
    /// What assistive technology wants a slider to say.
    virtual void setNumber(double /*number*/) {}
    virtual Accessibility accessibility() const;
    void setAccessibilityLabel(std::string label);
    const std::string& accessibilityLabel() const { return here(m_accessibilityLabel); }

    /// Flags that make this view part of the mask of a backdrop below it; see BackdropView.
    unsigned backdropMaskFlags() const { return here(m_backdropMaskFlags); }
    void setBackdropMaskFlags(unsigned flags);

    // For the presenter.
    /// Grows with each change of this view itself: values, children and their order.
    std::uint64_t revision() const { return here(m_revision); }
    /// Gives and forgets what was animated since the last call; one entry a property, the latest.
    std::vector<PropertyAnimation> takeAnimations();

    // For controllers.
    std::shared_ptr<ViewController> viewController() const;
    void setViewController(const std::weak_ptr<ViewController>& controller) { here(m_viewController) = controller; }

protected:
    /// Tells the presenter that this view has to be drawn anew.
    void setNeedsDisplay();
    /// After the view came into, or left, a window.
    virtual void didMoveToWindow() {}

private:
    friend class Window;

    friend class ViewController;

    void detachSubview(View& view);
    void placeSubview(const std::shared_ptr<View>& view, const View* below);
    bool reorderSubview(const View& view, const View* below);
    std::vector<Child>::iterator positionOf(const View* view);
    void dropConstraintsReferringTo(const View& view);
    void markConstraintsReferringTo(const View& view);
    void resizeSubviews(base::Size oldSize);
    /// Whether controllers whose views stand in this view have appeared.
    bool showsControllers() const;
    void appearControllers();
    std::vector<std::shared_ptr<ViewController>> topControllers() const;
    void markTintChanged();
    void noteAnimation(AnimatedProperty property, base::Rect fromFrame, double fromAlpha);
    void didMoveToWindowWithSubviews();
    void noteChange();
    base::Rect autoresizedFrame(base::Size oldParent, base::Size newParent) const;

    base::Rect m_frame;
    unsigned m_autoresizingMask = kAutoresizingNone;
    double m_alpha = 1;
    Color m_backgroundColor = Color::clear();
    std::optional<Color> m_tintColor;
    bool m_hidden = false;
    bool m_clipsToBounds = false;
    bool m_userInteractionEnabled = true;
    bool m_translatesAutoresizing = true;
    bool m_needsLayout = true;
    bool m_layingOut = false;
    unsigned m_backdropMaskFlags = 0;
    std::string m_accessibilityLabel;
    std::uint64_t m_revision = 1;

    std::vector<Child> m_children;
    std::weak_ptr<View> m_superview;
    std::weak_ptr<ViewController> m_viewController;
    std::vector<LayoutConstraint> m_constraints; ///< oldest first
    std::vector<std::shared_ptr<GestureRecognizer>> m_recognizers;
    std::vector<PropertyAnimation> m_animations;
};

} // namespace platform

/// The play button as a plain button with two images, for devices that are better spared a live blur. Main queue only.
#pragma once

#include "overlay/VKVideoOverlayButton.h"
#include "platform/views/Button.h"

class VKFlatVideoOverlayButton final : public platform::Button, public VKVideoOverlayButton {
public:
    static std::shared_ptr<VKFlatVideoOverlayButton> initWithStyle(const platform::Platform& platform,
                                                                   std::int64_t style);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }

    std::int64_t style() const override { return here(m_style); }
    void setTarget_action(const std::weak_ptr<runtime::Object>& target, const runtime::Selector& action) override;
    std::shared_ptr<platform::View> asView() override { return self<platform::View>(); }

    std::shared_ptr<runtime::Object> target() const { return here(m_target).lock(); }
    void setTarget(const std::weak_ptr<runtime::Object>& target) { here(m_target) = target; }
    const runtime::Selector& action() const { return here(m_action); }
    void setAction(const runtime::Selector& action) { here(m_action) = action; }

    void _handleTap(const std::shared_ptr<runtime::Object>& sender);

    /// The state images, each drawn once a process by whoever asks first.
    static platform::ImageRef _normalButtonImage(const platform::Platform& platform);
    static platform::ImageRef _highlightedButtonImage(const platform::Platform& platform);

    /// A disc of that grey and opacity with the glyph punched out and drawn back in at its own opacity. Null when a
    /// mask image is missing.
    static platform::ImageRef _createOverlayImageWithBackgroundWhite_backgroundAlpha_glyphAlpha(
        const platform::Platform& platform, double backgroundWhite, double backgroundAlpha, double glyphAlpha);

private:
    using Button::Button;

    std::int64_t m_style = kStyleAutomatic;
    std::weak_ptr<runtime::Object> m_target;
    runtime::Selector m_action;
};

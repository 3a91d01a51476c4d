/// The play button as a glyph over a live blur, masked to a disc. Main queue only.
#pragma once

#include "overlay/VKVideoOverlayButton.h"
#include "platform/views/BackdropView.h"
#include "platform/views/Button.h"

class VKHighFidelityVideoOverlayButton final : public platform::View, public VKVideoOverlayButton {
public:
    /// Only `kStyleAutomatic` has the blurred backdrop; other styles are the bare glyph.
    static std::shared_ptr<VKHighFidelityVideoOverlayButton> initWithStyle(const platform::Platform& platform,
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

    const std::shared_ptr<platform::Button>& button() const { return here(m_button); }
    const std::shared_ptr<platform::BackdropView>& backdropView() const { return here(m_backdropView); }

    void _playButtonActivate(const std::shared_ptr<runtime::Object>& sender);
    void _playButtonDeactivate(const std::shared_ptr<runtime::Object>& sender);
    void _playButtonTapped(const std::shared_ptr<runtime::Object>& sender);

private:
    using View::View;

    void addBackdrop(const platform::Platform& platform);

    std::int64_t m_style = kStyleAutomatic;
    std::shared_ptr<platform::Button> m_button;
    std::shared_ptr<platform::BackdropView> m_backdropView;
    std::weak_ptr<runtime::Object> m_target;
    runtime::Selector m_action;
};

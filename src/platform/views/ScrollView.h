/// Shows a part of a content that is higher than it: by drag, with inertia, by wheel, and where the focus goes. Main queue.
#pragma once

#include "platform/views/PanGestureRecognizer.h"
#include "platform/views/SurfaceView.h"

#include <cstdint>
#include <memory>

namespace platform {

class ScrollView final : public View {
public:
    explicit ScrollView(base::Rect frame = {});

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// As wide as this; what is shown is added to it.
    const std::shared_ptr<View>& contentView() const { return here(m_content); }
    double contentHeight() const { return here(m_contentHeight); }
    void setContentHeight(double height);

    /// How far it is scrolled down, in points: from 0 to the maximum.
    double contentOffset() const { return here(m_offset); }
    void setContentOffset(double offset);
    double maximumOffset() const;

    bool scrollBy(double points) override;
    void reveal(const View& view) override;
    void layoutSubviews() override;

protected:
    void didMoveToWindow() override;

private:
    void pan(const PanGestureRecognizer::Pan& pan);
    void coast(double velocity);
    void coastOn(double velocity, std::uint64_t run);
    void placeScroller();

    std::shared_ptr<View> m_content;
    std::shared_ptr<SurfaceView> m_scroller;
    std::shared_ptr<PanGestureRecognizer> m_recognizer;
    double m_contentHeight = 0;
    double m_offset = 0;
    double m_offsetAtStart = 0; ///< of the drag
    std::uint64_t m_coasts = 0; ///< so many have begun, or been stopped
};

} // namespace platform

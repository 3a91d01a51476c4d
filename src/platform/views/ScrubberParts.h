/// What a movie scrubber puts on its strip: the play head, the frame around the chosen range, and its two handles as
/// assistive technology and keys see them. Main queue only.
///
/// The scrubber makes and places them; touches are its own.
#pragma once

#include "platform/views/View.h"

namespace platform {

class MovieScrubber;

/// What the user holds.
enum class ScrubberHandle : int { None = 0, PlayHead = 1, Start = 2, End = 3 };

/// As wide as its knob; the moment is in its middle.
class PlayHeadView final : public View {
public:
    /// Points.
    static constexpr double kWidth = 24;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    bool isHeld() const { return here(m_held); }
    void setHeld(bool held);

private:
    bool m_held = false;
};

/// Around the range and the grips, which stand at its left and right end.
class TrimFrameView final : public View {
public:
    /// Points, of one grip.
    static constexpr double kGripWidth = 16;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// Outside editing there are only the grips.
    bool isEditing() const { return here(m_editing); }
    void setEditing(bool editing);
    ScrubberHandle held() const { return here(m_held); }
    void setHeld(ScrubberHandle held);

private:
    bool m_editing = false;
    ScrubberHandle m_held = ScrubberHandle::None;
};

/// A slider of its own, where the grip is; the frame draws it.
class TrimHandleView final : public View {
public:
    explicit TrimHandleView(ScrubberHandle handle) : m_handle(handle) {}

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    bool canBecomeFocused() const override;
    Accessibility accessibility() const override;
    bool adjust(int steps) override;
    void setNumber(double seconds) override;

private:
    std::shared_ptr<MovieScrubber> scrubber() const;

    ScrubberHandle m_handle;
};

} // namespace platform

/// A bar with a row of items. Items between flexible spaces are centred in what is left. Main queue only.
#pragma once

#include "platform/views/BarButtonItem.h"
#include "platform/views/View.h"

namespace platform {

/// Nothing to answer yet: a toolbar relies on the defaults.
class ToolbarDelegate {
public:
    virtual ~ToolbarDelegate() = default;
};

class Toolbar final : public View {
public:
    /// Touch targets are at least this wide and high, in points.
    static constexpr double kTouchSize = 44;
    /// Between the bar's ends and its first and last item.
    static constexpr double kEndMargin = 8;

    using Items = std::vector<std::shared_ptr<BarButtonItem>>;

    using View::View;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    const Items& items() const { return here(m_items); }
    /// The same item may stand in several places when it is a space.
    void setItems(Items items, bool animated = false);

    std::shared_ptr<ToolbarDelegate> delegate() const { return here(m_delegate).lock(); }
    void setDelegate(std::weak_ptr<ToolbarDelegate> delegate) { here(m_delegate) = std::move(delegate); }

    /// Places the items: the row's title (a custom view between flexible spaces) is centred in the bar itself as long
    /// as it does not meet its neighbours. In a window that runs from right to left the first item is the rightmost.
    void layoutSubviews() override;
    Accessibility accessibility() const override;

private:
    /// A title that had to shrink: it grows back to what it wanted to be as soon as there is room.
    struct Shrunk {
        std::weak_ptr<View> view;
        double wanted;
        double given;
    };

    double wantedWidth(BarButtonItem& item) const;
    void place(const std::shared_ptr<View>& view, double x, double width);

    std::vector<Shrunk> m_shrunk;
    std::vector<std::weak_ptr<View>> m_placed; ///< have a place already: a move from it may be animated
    Items m_items;
    std::weak_ptr<ToolbarDelegate> m_delegate;
};

} // namespace platform

/// The ring around what has the keyboard's focus, above everything else. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"

namespace qtui {

class FocusRing final : public PeerItem {
public:
    explicit FocusRing(Stage& stage);

    /// Around `target`, kept inside `window`; nowhere when it is empty. Window coordinates.
    void showAround(const QRectF& target, const QRectF& window);

private:
    QRectF m_ring;
    std::uint64_t m_generation = 0;
};

} // namespace qtui

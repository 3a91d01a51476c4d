/// Something to draw that takes no touches and has no children: a player's picture. Main queue only.
#pragma once

#include "base/Geometry.h"
#include "runtime/Object.h"

#include <cstdint>
#include <functional>
#include <utility>

namespace platform {

class Layer : public runtime::Object {
public:
    /// In the coordinates of the view that it was added to.
    base::Rect frame() const { return here(m_frame); }
    void setFrame(base::Rect frame)
    {
        assertHere();
        if (m_frame == frame)
            return;
        m_frame = frame;
        setNeedsDisplay();
    }

    /// Grows with each change that has to be drawn.
    std::uint64_t revision() const { return here(m_revision); }

    /// Who is told of such changes: the view that it was added to.
    void setDisplayHandler(std::function<void()> handler) { here(m_displayHandler) = std::move(handler); }

protected:
    void setNeedsDisplay()
    {
        ++m_revision;
        if (m_displayHandler)
            m_displayHandler();
    }

private:
    base::Rect m_frame;
    std::uint64_t m_revision = 1;
    std::function<void()> m_displayHandler;
};

} // namespace platform

/// Touches and keys as a person would make them, sent into a window through Qt's own events. GUI thread.
#pragma once

#include "base/Affinity.h"
#include "base/Geometry.h"

#include <string>

class QQuickWindow;

namespace app {

class SyntheticInput {
public:
    explicit SyntheticInput(QQuickWindow& window) : m_window(window) {}

    // One finger, in points.
    void press(base::Point at);
    void move(base::Point to);
    void release(base::Point at);
    /// False for a name that is no key.
    bool key(const std::string& name);

private:
    base::Affinity m_affinity;
    QQuickWindow& m_window;
};

} // namespace app

/// While it lives, the program ends with one line that a person can use when there is no display to open a window on;
/// Qt would abort, and advise to install the program anew. Lives around the making of the application; one at a time.
#pragma once

#include <QtGlobal>

namespace app {

/// What the program ends with; sysexits.h calls it "unavailable".
inline constexpr int kNoDisplay = 69;

class DisplayWatch {
public:
    DisplayWatch();
    ~DisplayWatch();
    DisplayWatch(const DisplayWatch&) = delete;
    DisplayWatch& operator=(const DisplayWatch&) = delete;

private:
    QtMessageHandler m_former;
};

} // namespace app

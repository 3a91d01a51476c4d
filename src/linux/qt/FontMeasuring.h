/// How large words come out in the system's font. GUI thread.
#pragma once

#include "base/Affinity.h"
#include "platform/views/TextMeasuring.h"

namespace qtui {

class FontMeasuring final : public platform::TextMeasuring {
public:
    double widthOf(std::string_view text, const platform::TextStyle& style) const override;
    double heightOf(std::string_view text, const platform::TextStyle& style, double width,
                    int mostLines) const override;

private:
    base::Affinity m_affinity;
};

} // namespace qtui

#include "overlay/VKVideoOverlayButton.h"

#include "overlay/VKFlatVideoOverlayButton.h"
#include "overlay/VKHighFidelityVideoOverlayButton.h"

namespace VKExtensions {

std::shared_ptr<VKVideoOverlayButton> _srVideoOverlayButtonWithStyle(const platform::Platform& platform,
                                                                     std::int64_t style)
{
    const bool flat = style == VKVideoOverlayButton::kStyleFlat
                      || (style == VKVideoOverlayButton::kStyleAutomatic
                          && platform.device.graphicsQuality() == VKVideoOverlayButton::kGraphicsQualityWithoutBlur);
    if (flat)
        return VKFlatVideoOverlayButton::initWithStyle(platform, style);
    return VKHighFidelityVideoOverlayButton::initWithStyle(platform, style);
}

} // namespace VKExtensions

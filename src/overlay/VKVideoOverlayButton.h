/// The large play button over the paused movie, in two looks that answer the same small protocol. Main queue only.
#pragma once

#include "platform/hosting/Platform.h"
#include "platform/views/View.h"
#include "runtime/Object.h"

#include <cstdint>
#include <memory>

/// Opacity of the glyph at rest and while pressed. Values written with an F are the single-precision value, widened.
inline constexpr double VKVideoOverlayDefaultGlyphAlpha = static_cast<double>(0.3F);
inline constexpr double VKVideoOverlayHighlightedGlyphAlpha = 0.5;
/// Grey level and opacity of the flat button's disc: 0 black, 1 white; 0 clear, 1 opaque.
inline constexpr double VKVideoOverlayFlatBackgroundWhite = static_cast<double>(0.96F);
inline constexpr double VKVideoOverlayFlatBackgroundAlpha = static_cast<double>(0.96F);

/// Pictures in the program's own bundle: a play glyph, and a mask whose transparent part is the disc.
inline constexpr const char* VKVideoOverlayGlyphMaskImageName = "VKVideoOverlayGlyphMask";
inline constexpr const char* VKVideoOverlayBackgroundMaskImageName = "VKVideoOverlayBackgroundMask";

class VKVideoOverlayButton {
public:
    /// Blurred backdrop where the device can afford it, else flat.
    static constexpr std::int64_t kStyleAutomatic = 0;
    static constexpr std::int64_t kStyleFlat = 2;
    /// The device's graphics quality for which the automatic style is flat.
    static constexpr std::int32_t kGraphicsQualityWithoutBlur = 10;

    virtual ~VKVideoOverlayButton() = default;

    /// The style that it was asked for with, which need not be the look that it got.
    virtual std::int64_t style() const = 0;
    /// The target is weak; the action gets the overlay button as its argument.
    virtual void setTarget_action(const std::weak_ptr<runtime::Object>& target, const runtime::Selector& action) = 0;
    /// This button as the view that it is.
    virtual std::shared_ptr<platform::View> asView() = 0;
};

namespace VKExtensions {

/// A new button in the look that `style` asks for: 0 automatic, 2 flat, all else a glyph without a backdrop.
std::shared_ptr<VKVideoOverlayButton> _srVideoOverlayButtonWithStyle(const platform::Platform& platform,
                                                                     std::int64_t style);

} // namespace VKExtensions

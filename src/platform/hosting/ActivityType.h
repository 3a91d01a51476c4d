/// What the predefined activities are called when the host is told which of them the user completed.
#pragma once

namespace platform {

/// The movie was put into the photo library, or a trim of it was confirmed.
inline constexpr const char* kActivityTypeSaveToCameraRoll = "SaveToCameraRoll";

} // namespace platform

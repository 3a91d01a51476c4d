/// The platform's own share activities, by the names under which hosts hear of them.
#pragma once

namespace platform {

inline constexpr const char* kActivityTypeMail = "Mail";
inline constexpr const char* kActivityTypeMessage = "Message";
inline constexpr const char* kActivityTypeCopyToPasteboard = "CopyToPasteboard";
inline constexpr const char* kActivityTypePostToFacebook = "PostToFacebook";
/// Saved to the user's library of videos.
inline constexpr const char* kActivityTypeSaveToCameraRoll = "SaveToCameraRoll";

} // namespace platform

/// The platform's own share activities, by the names under which hosts hear of them.
#pragma once

namespace platform {

inline constexpr const char* kActivityTypeMail = "Mail";
inline constexpr const char* kActivityTypeMessage = "Message";
inline constexpr const char* kActivityTypeCopyToPasteboard = "CopyToPasteboard";
inline constexpr const char* kActivityTypePostToFacebook = "PostToFacebook";
/// The movie was put into the user's library, or a trim of it was confirmed.
inline constexpr const char* kActivityTypeSaveToCameraRoll = "SaveToCameraRoll";

inline constexpr const char* kActivityTypeKdeConnect = "KDEConnect";
inline constexpr const char* kActivityTypeGsConnect = "GSConnect";
inline constexpr const char* kActivityTypeBluetooth = "Bluetooth";
inline constexpr const char* kActivityTypeOpenWith = "OpenWith";
inline constexpr const char* kActivityTypeSaveACopy = "SaveACopy";
inline constexpr const char* kActivityTypeShowInFolder = "ShowInFolder";

} // namespace platform

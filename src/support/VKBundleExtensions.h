/// Words and names that live in bundles: of the recording framework, of the photo framework, and of installed apps.
///
/// What the system adds to the platform's bundle class, the receiver first: the device's bundles stand for the class. Any
/// thread; everything runs at once, on the caller's. Nothing is kept but the two frameworks' bundles, for the life of the
/// process.
#pragma once

#include "platform/files/Bundles.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace VKExtensions {

/// The recording framework's bundle. Looked for once a process, also by first callers that come together; null from then on
/// when it was not there.
platform::BundleRef _vkFrameworkBundle(platform::Bundles& receiver);

/// Its directory of the language that serves the user best; null when there is none.
platform::BundleRef localizedBundle(platform::Bundles& receiver);

/// Its directory of the base language of what the user prefers most: "en" for "en-GB"; null when there is none.
platform::BundleRef fallbackBundle(platform::Bundles& receiver);

/// The recording framework's text: of the first of the three bundles above (best, base, the framework itself) that is
/// there. The key itself when that has no such text, nothing when none is there.
std::optional<std::string> _vkLocalizedStringFromFrameworkBundleWithKey(platform::Bundles& receiver,
                                                                        const std::string& key);

/// What an app is called in the user's language; nothing when no such app is known.
std::optional<std::string> _vkLocalizedAppNameFromBundleID(platform::Bundles& receiver, const std::string& identifier);

/// Without the last of the parts that dots divide: "com.example" of "com.example.app"; empty when there is no dot.
std::string baseIdentifier(std::string_view identifier);

/// The bundle of the program that a process runs; null when either cannot be known.
platform::BundleRef bundleWithPID(platform::Bundles& receiver, std::int32_t process);

/// The bundle's display name in the user's language, else its own, else its short name, else "".
std::string _vkLocalizedAppName(const platform::Bundle& receiver);

} // namespace VKExtensions

/// The photo framework's bundle, which its tile controller comes with. Looked for until it is found; then it is kept.
platform::BundleRef VKPictoraFrameworkBundle(platform::Bundles& bundles);

/// The photo framework's text: of the first of its four tables that has one other than the key. The key itself when none
/// has, nothing when there is no such bundle.
std::optional<std::string> VKLocalizedFrameworkString(platform::Bundles& bundles, const std::string& key);

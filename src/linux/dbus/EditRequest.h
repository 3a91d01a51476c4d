/// What a recorder, or a person at a shell, asks for: a movie to be edited, and how. Files are open already and known
/// to be readable; texts are UTF-8 and not larger than what can travel.
#pragma once

#include "linux/dbus/FileDescriptor.h"
#include "platform/views/Color.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace dbus {

/// The bundle identifier of a recording whose app is not known; one must be given.
inline constexpr const char* kUnknownBundleIdentifier = "org.clipsa.recording";

struct EditRequest {
    FileDescriptor movie;
    std::string movieName; ///< the file name that the editor's own copy gets
    std::string appName;
    std::string bundleIdentifier = kUnknownBundleIdentifier;
    /// A file to share with the movie: where it is, or an open file of this name.
    std::string attachmentPath;
    FileDescriptor attachment;
    std::string attachmentName;
    std::optional<std::string> message;
    std::optional<platform::Color> tint;
    std::vector<std::string> editorArguments;
    /// Added to the editor's environment.
    std::vector<std::pair<std::string, std::string>> environment;
};

} // namespace dbus

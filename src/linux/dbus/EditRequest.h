/// What a recorder, or a person at a shell, asks for: a movie to be edited, and how. A plain value that owns its open
/// files. Nothing in it has been checked before the host has prepared it; what is empty then gets its default.
#pragma once

#include "linux/dbus/Asker.h"
#include "linux/posix/FileDescriptor.h"
#include "platform/views/Color.h"

#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace dbus {

/// The domain of errors that are the asker's, as opposed to the machine's.
inline constexpr const char* kBadInputDomain = "org.clipsa.input";
/// The user-info key of what the asker is not told of an error, as it would tell of files that may not be theirs to know.
inline constexpr const char* kUntoldKey = "untold";

struct EditRequest {
    /// Who names paths by the bus; null for whoever runs us, whose right to files is ours.
    std::shared_ptr<const Asker> asker;
    /// The movie: where it is, or an open file.
    std::string moviePath;
    posix::FileDescriptor movie;
    std::string movieName; ///< the file name that the editor's own copy gets
    std::string appName;
    std::string bundleIdentifier;
    /// A file to share with the movie: where it is, or an open file.
    std::string attachmentPath;
    posix::FileDescriptor attachment;
    std::string attachmentName; ///< of an open file
    std::optional<std::string> message;
    std::optional<platform::Color> tint;
    std::vector<std::string> editorArguments;
    /// Added to the editor's environment.
    std::vector<std::pair<std::string, std::string>> environment;
};

} // namespace dbus

/// What the words on the command line of `clipsa` say; nothing is opened or done yet. Any thread.
#pragma once

#include "app/host/MediaCommandLine.h"
#include "base/Result.h"
#include "platform/views/Color.h"

#include <chrono>
#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace host {

struct OpenCommand {
    std::string movie;
    std::string appName;  ///< empty: the movie's file name without its extension
    std::string bundleId; ///< empty: unknown
    std::string attachment;
    std::optional<std::string> message;
    std::optional<platform::Color> tint;
    bool json = false;
    /// `--device`, `--home-button` and `--graphics-quality`, checked, as the editor takes them.
    std::vector<std::string> editorArguments;
};

struct TourCommand {
    OpenCommand open;
    std::string output; ///< the directory for the pictures
};

struct ServiceCommand {
    /// How long it stays with nothing to do.
    std::chrono::seconds idle{30};
};

struct HelpCommand {};
struct VersionCommand {};

using Command = std::variant<OpenCommand, TourCommand, ServiceCommand, MediaCommand, HelpCommand, VersionCommand>;

/// `words` without the program's name. The error is one line that says which word is wrong and what to do.
base::Result<Command> parseCommandLine(const std::vector<std::string>& words);

/// What `clipsa --help` and `clipsa --version` print.
extern const char* const kHelpText;
extern const char* const kVersionText;

} // namespace host

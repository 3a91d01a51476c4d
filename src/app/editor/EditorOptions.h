/// What the host, or a developer, says to the editor process on its command line.
#pragma once

#include "base/Geometry.h"
#include "base/Result.h"
#include "platform/device/Device.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace app {

struct EditorOptions {
    std::string address;    ///< of the host's connection
    std::string deviceRoot; ///< the directory that stands for the device's private library
    std::optional<platform::InterfaceIdiom> idiom;
    std::optional<bool> hasHomeButton;
    std::optional<std::int32_t> graphicsQuality;
    std::optional<std::int32_t> report; ///< the open file that tells the host of saved movies
    bool verbose = false;
    bool explain = false; ///< in the window what is wrong with the movie, as nobody else will

    /// Arguments as the host passes them, program name left out.
    static base::Result<EditorOptions> parse(const std::vector<std::string>& arguments);
};

} // namespace app

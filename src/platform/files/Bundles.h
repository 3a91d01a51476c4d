/// The bundles of the device: which there are, and who they belong to. Any thread.
#pragma once

#include "base/Url.h"
#include "platform/files/Bundle.h"
#include "platform/files/Languages.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace platform {

class Bundles {
public:
    virtual ~Bundles() = default;

    virtual const Languages& languages() const = 0;

    /// Null when none is there.
    virtual BundleRef bundleWithPath(const std::string& path) = 0;
    virtual BundleRef bundleWithURL(const base::Url& url) = 0;
    /// Of a bundle that was asked for before, or of an installed application; else null.
    virtual BundleRef bundleWithIdentifier(const std::string& identifier) = 0;
    /// The bundle that the class of this name comes with; null when no such class is on the device.
    virtual BundleRef bundleForClassNamed(std::string_view name) = 0;

    /// The program that a process runs; nothing when there is no such process, or it is not for us to know.
    virtual std::optional<std::string> executablePathOfProcess(std::int32_t process) = 0;
    /// The bundle that a program comes with.
    virtual std::optional<base::Url> bundleURLForExecutableURL(const base::Url& executable) = 0;
};

} // namespace platform

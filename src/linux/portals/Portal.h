/// The desktop's portal: what programs may ask of the desktop, in a sandbox or not. Main queue only; nothing waits.
#pragma once

#include "base/Affinity.h"
#include "base/System.h"
#include "linux/bus/Bus.h"
#include "linux/bus/Calls.h"

#include <QString>

#include <functional>
#include <map>
#include <memory>
#include <string>

namespace portals {

inline constexpr const char* kService = "org.freedesktop.portal.Desktop";
inline constexpr const char* kPath = "/org/freedesktop/portal/desktop";
inline constexpr const char* kEmail = "org.freedesktop.portal.Email";
inline constexpr const char* kOpenUri = "org.freedesktop.portal.OpenURI";
inline constexpr const char* kFileChooser = "org.freedesktop.portal.FileChooser";

/// The first version of OpenURI that opens files by their descriptors, and the one that shows directories.
inline constexpr unsigned kOpenFileVersion = 2;
inline constexpr unsigned kOpenDirectoryVersion = 3;

class Portal {
public:
    /// By interface; those that are not there are missing.
    using Versions = std::map<std::string, unsigned>;
    /// "x11:HEX" or "wayland:HANDLE" of the window that dialogues belong to; empty when there is none.
    using ParentWindow = std::function<std::string()>;

    /// A portal that takes longer to say what it can do counts as one that is not there. On the clock.
    static constexpr std::chrono::seconds kVersionLimit{2};

    /// `system` outlives this.
    Portal(const base::System& system, bus::Bus::Connect connect, ParentWindow parentWindow);

    /// Asks which of the interfaces above there are, and starts the portal for that, where it can be started. `answered`
    /// runs once, not before this returns, and not once this has gone.
    void askVersions(std::function<void(const Versions& versions)> answered);

    const base::System& system() const { return m_system; }
    bus::Bus& bus() { return m_bus; }
    std::string parentWindow() const { return m_parentWindow ? m_parentWindow() : std::string(); }

private:
    struct Asking;

    const base::System& m_system;
    ParentWindow m_parentWindow;
    bus::Bus m_bus;
    bus::Calls m_calls;
    base::Affinity m_affinity;
};

} // namespace portals

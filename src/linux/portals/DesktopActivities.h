/// Finds what the desktop and the applications on it can do with a movie: mail, message, open with, save a copy, show in
/// folder. Main queue only.
#pragma once

#include "linux/portals/Applications.h"
#include "linux/portals/Portal.h"
#include "linux/sharing/Environment.h"
#include "platform/sharing/ActivityProvider.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace portals {

class DesktopActivities final : public platform::ActivityProvider {
public:
    struct Settings {
        bus::Bus::Connect bus = bus::Bus::session();
        /// Asked whenever there is a dialogue.
        Portal::ParentWindow parentWindow = {};
        /// Where copies are saved, unless the user chooses another place; empty: the chooser decides.
        std::string folder = {};
        /// Asked on a worker.
        std::function<ApplicationDirectories()> applications = &ApplicationDirectories::ofUser;
    };

    /// `environment` outlives this and the activities.
    DesktopActivities(const sharing::Environment& environment, Settings settings);
    ~DesktopActivities() override;

    void findActivities(const platform::ShareItems& items, Found found) override;

private:
    struct Search;

    const sharing::Environment& m_environment;
    const Settings m_settings;
    const std::shared_ptr<Portal> m_portal;
    std::vector<std::shared_ptr<Search>> m_searches; ///< those under way
    base::Affinity m_affinity;
};

} // namespace portals

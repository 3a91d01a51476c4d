/// What can be done with a movie on this machine, for the editor's share sheet and for `clipsa share`: all who know some of
/// it, and the outbox that they use. Main thread, with a Qt event loop.
#pragma once

#include "base/Affinity.h"
#include "base/System.h"
#include "base/WorkList.h"
#include "platform/files/FileManager.h"
#include "platform/files/MessageCatalog.h"
#include "platform/photos/PhotoLibrary.h"
#include "platform/sharing/Sharing.h"

#include <functional>
#include <memory>
#include <string>

namespace app {

class ShareServices final : public platform::Sharing {
public:
    /// What it refers to outlives this.
    struct Options {
        const base::System& system;
        const platform::MessageCatalog& words;
        const platform::FileManager& files;
        base::WorkList& works;
        platform::PhotoLibrary& photos;
        std::function<std::string(const base::Url& file)> nameOf;
        /// Our window, as portals call it; empty without one.
        std::function<std::string()> parentWindow = {};
        std::function<void(const platform::Activity& activity, const platform::Activity::End& end)> ended = {};
    };

    explicit ShareServices(Options options);
    ~ShareServices() override;

    platform::ActivityProvider& activities() override;
    std::string nameOf(const base::Url& file) const override;
    void activityEnded(const platform::Activity& activity, const platform::Activity::End& end) override;

private:
    struct Services;

    std::unique_ptr<Services> m_services;
    base::Affinity m_affinity;
};

} // namespace app

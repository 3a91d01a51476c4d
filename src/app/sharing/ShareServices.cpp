#include "app/sharing/ShareServices.h"

#include "linux/devices/DeviceProvider.h"
#include "linux/photos/UserDirectories.h"
#include "linux/portals/DesktopActivities.h"
#include "linux/sharing/Environment.h"
#include "platform/sharing/CombinedActivities.h"
#include "platform/sharing/SaveToVideosActivity.h"

#include <utility>

namespace app {

namespace {

/// Where nothing can be put that has no place at all.
sharing::Outbox userOutbox(base::Log& log)
{
    const auto outbox = sharing::Outbox::ofUser();
    if (!outbox)
        log.error(outbox.error()->description());
    return outbox.valueOr(sharing::Outbox("/dev/null/outbox"));
}

/// Offers to put the movie into the library.
class Keeping final : public platform::ActivityProvider {
public:
    explicit Keeping(const ShareServices::Options& options) : m_options(options) {}

    void findActivities(const platform::ShareItems&, Found found) override
    {
        m_options.system.mainQueue.post([weak = std::weak_ptr(m_alive), this, found = std::move(found)] {
            if (!weak.expired())
                found({std::make_shared<platform::SaveToVideosActivity>(m_options.words, m_options.photos,
                                                                        m_options.system.mainQueue)},
                      true);
        });
    }

private:
    const ShareServices::Options& m_options;
    std::shared_ptr<bool> m_alive = std::make_shared<bool>(true);
};

} // namespace

struct ShareServices::Services {
    explicit Services(Options given)
        : options(std::move(given)),
          outbox(userOutbox(options.system.log)), environment{options.system, options.words, options.files,
                                                              options.works,  outbox,        options.nameOf},
          desktop(environment,
                  {.parentWindow = options.parentWindow, .folder = photos::UserDirectories::ofUser().videos}),
          devices(environment), keeping(options), all({&desktop, &devices, &keeping})
    {
    }

    const Options options;
    const sharing::Outbox outbox;
    const sharing::Environment environment;
    portals::DesktopActivities desktop;
    devices::DeviceProvider devices;
    Keeping keeping;
    platform::CombinedActivities all;
};

ShareServices::ShareServices(Options options) : m_services(std::make_unique<Services>(std::move(options)))
{
    // What is a day old has had its readers; nobody waits for the disk.
    m_services->options.system.backgroundQueue.post([outbox = m_services->outbox] { outbox.sweep(); });
}

ShareServices::~ShareServices()
{
    m_affinity.assertHere();
}

platform::ActivityProvider& ShareServices::activities()
{
    m_affinity.assertHere();
    return m_services->all;
}

std::string ShareServices::nameOf(const base::Url& file) const
{
    m_affinity.assertHere();
    return m_services->options.nameOf(file);
}

void ShareServices::activityEnded(const platform::Activity& activity, const platform::Activity::End& end)
{
    m_affinity.assertHere();
    if (m_services->options.ended)
        m_services->options.ended(activity, end);
}

} // namespace app

#include "app/sharing/ShareServices.h"

#include "linux/photos/UserDirectories.h"
#include "platform/sharing/SaveToVideosActivity.h"

#include <utility>

namespace app {

ShareServices::ShareServices(Options options) : m_options(std::move(options)), m_keeping(m_options), m_all({&m_keeping})
{
}

platform::ActivityProvider& ShareServices::activities()
{
    m_affinity.assertHere();
    return m_all;
}

std::string ShareServices::nameOf(const base::Url& file) const
{
    m_affinity.assertHere();
    return m_options.nameOf(file);
}

void ShareServices::activityEnded(const platform::Activity& activity, const platform::Activity::End& end)
{
    m_affinity.assertHere();
    if (m_options.ended)
        m_options.ended(activity, end);
}

void ShareServices::Keeping::findActivities(const platform::ShareItems&, Found found)
{
    m_options.system.mainQueue.post([found = std::move(found), this] {
        found({std::make_shared<platform::SaveToVideosActivity>(m_options.words, m_options.photos,
                                                                m_options.system.mainQueue)},
              true);
    });
}

} // namespace app

#include "platform/sharing/Activity.h"

#include <utility>

namespace platform {

const runtime::Class& Activity::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<Activity>("Activity", &runtime::Object::classObject()).build();
    return instance;
}

const runtime::Class& Activity::isa() const
{
    return classObject();
}

void Activity::setEndHandler(std::function<void(const End&)> handler)
{
    assertHere();
    m_endHandler = std::move(handler);
}

void Activity::activityDidFinish(bool completed)
{
    assertHere();
    end({completed, nullptr});
}

void Activity::activityDidFail(base::ErrorRef error)
{
    assertHere();
    end({false, std::move(error)});
}

void Activity::noteProgress(std::optional<double> progress) const
{
    assertHere();
    if (m_progressHandler)
        m_progressHandler(progress);
}

void Activity::end(const End& how)
{
    const auto keepAlive = weak_from_this().lock(); // its owner lets go of it
    m_progressHandler = {};
    if (const auto handler = std::exchange(m_endHandler, {}))
        handler(how);
}

} // namespace platform

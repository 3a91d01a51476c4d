/// An activity that asks the portal to do something with files in the outbox. Main queue only.
#pragma once

#include "linux/portals/PortalRequest.h"
#include "linux/sharing/OutboxActivity.h"

#include <memory>

namespace portals {

/// For people: what became of `activity`, which is its title. `refusedKey` is the message where the portal cannot do it.
base::ErrorRef errorOf(const PortalRequest::Outcome& outcome, const char* refusedKey, const std::string& activity);

class PortalActivity : public sharing::OutboxActivity {
protected:
    PortalActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal, sharing::Outbox::Use use,
                   const char* refusedKey)
        : OutboxActivity(environment, use), m_portal(std::move(portal)), m_refusedKey(refusedKey)
    {
    }

    void request(PortalRequest::Call call);
    /// The portal has done it.
    virtual void done(const QVariantMap& /*results*/) { complete(); }
    void stop() override { m_request.reset(); }

private:
    const std::shared_ptr<Portal> m_portal;
    const char* m_refusedKey;
    std::unique_ptr<PortalRequest> m_request;
};

} // namespace portals

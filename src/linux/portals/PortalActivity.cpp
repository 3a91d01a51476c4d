#include "linux/portals/PortalActivity.h"

#include <utility>

namespace portals {

base::ErrorRef errorOf(const PortalRequest::Outcome& outcome, const char* refusedKey, const std::string& activity)
{
    const char* key = refusedKey;
    if (outcome.end == PortalRequest::End::NoAnswer)
        key = "SHARE_DESKTOP_SILENT";
    else if (outcome.end == PortalRequest::End::Vanished)
        key = "SHARE_DESKTOP_GONE";
    return base::Error::withMessage(
        base::Error::make("org.clipsa.portals", static_cast<std::int64_t>(outcome.end), outcome.reason), key,
        {{"activity", activity}});
}

void PortalActivity::request(PortalRequest::Call call)
{
    assertHere();
    noteProgress(std::nullopt); // how long the user takes is not known
    // It goes with us, and so does what it calls.
    m_request =
        std::make_unique<PortalRequest>(m_portal, std::move(call), [this](const PortalRequest::Outcome& outcome) {
            const auto request = std::move(m_request);
            switch (outcome.end) {
            case PortalRequest::End::Done:
                done(outcome.results);
                break;
            case PortalRequest::End::Cancelled:
                giveUp();
                break;
            default:
                fail(errorOf(outcome, m_refusedKey, activityTitle()));
                break;
            }
        });
}

} // namespace portals

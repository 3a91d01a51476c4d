/// Opens an address with what the user has for it: a web page in the browser. Main queue only.
#pragma once

#include "linux/portals/PortalRequest.h"

#include <memory>
#include <string>

namespace portals {

/// Asks the portal; as PortalRequest, which it gives: whoever lets go of it gives it up. Not for files.
std::unique_ptr<PortalRequest> openUri(std::shared_ptr<Portal> portal, const std::string& uri,
                                       PortalRequest::Ended ended);

} // namespace portals

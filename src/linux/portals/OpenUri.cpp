#include "linux/portals/OpenUri.h"

#include <utility>

namespace portals {

std::unique_ptr<PortalRequest> openUri(std::shared_ptr<Portal> portal, const std::string& uri,
                                       PortalRequest::Ended ended)
{
    return std::make_unique<PortalRequest>(std::move(portal),
                                           PortalRequest::Call{kOpenUri, "OpenURI", {QString::fromStdString(uri)}, {}},
                                           std::move(ended));
}

} // namespace portals

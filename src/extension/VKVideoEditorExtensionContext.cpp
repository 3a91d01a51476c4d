#include "extension/VKVideoEditorExtensionContext.h"

#include "extension/VKVideoEditorExtensionViewController.h"

#include <string>
#include <utility>

using platform::ConnectionInterface;
using runtime::Selector;

namespace {

constexpr const char* kDidFinishSelector = "extensionDidFinishWithActivityTypes:";

/// Turns calls into messages to the host.
class HostProxy final : public VKVideoEditorExtensionHostProtocol {
public:
    explicit HostProxy(std::shared_ptr<platform::RemoteProxy> remote) : m_remote(std::move(remote)) {}

    void extensionDidFinishWithActivityTypes(const std::shared_ptr<ActivityTypes>& activityTypes) override
    {
        m_remote->send(Selector(kDidFinishSelector), {activityTypes ? *activityTypes : ActivityTypes{}});
    }

private:
    std::shared_ptr<platform::RemoteProxy> m_remote;
};

} // namespace

ConnectionInterface VKVideoEditorExtensionProtocol::connectionInterface()
{
    return {"VKVideoEditorExtensionProtocol", {}};
}

ConnectionInterface VKVideoEditorExtensionHostProtocol::connectionInterface()
{
    return {"VKVideoEditorExtensionHostProtocol", {Selector(kDidFinishSelector)}};
}

const runtime::Class& VKVideoEditorExtensionContext::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<VKVideoEditorExtensionContext>(
                                                "VKVideoEditorExtensionContext", &ExtensionContext::classObject())
                                                .maker([] { return std::make_shared<VKVideoEditorExtensionContext>(); })
                                                .build();
    return instance;
}

ConnectionInterface VKVideoEditorExtensionContext::_extensionAuxiliaryVendorProtocol()
{
    return VKVideoEditorExtensionProtocol::connectionInterface();
}

ConnectionInterface VKVideoEditorExtensionContext::_extensionAuxiliaryHostProtocol()
{
    return VKVideoEditorExtensionHostProtocol::connectionInterface();
}

std::shared_ptr<VKVideoEditorExtensionViewController>
VKVideoEditorExtensionContext::videoEditorExtensionViewController() const
{
    assertHere();
    return std::dynamic_pointer_cast<VKVideoEditorExtensionViewController>(principalObject());
}

std::shared_ptr<VKVideoEditorExtensionHostProtocol> VKVideoEditorExtensionContext::extensionObjectProxy() const
{
    assertHere();
    if (!auxiliaryConnection())
        return nullptr;
    base::Log& log = platform().system.log;
    return std::make_shared<HostProxy>(
        auxiliaryConnection()->remoteObjectProxyWithErrorHandler([&log](const base::ErrorRef& error) {
            log.error("error calling extension - " + std::to_string(error->code32()));
            log.console(error->description());
        }));
}

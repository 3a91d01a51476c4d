/// The extension's own context: it declares the connection's two protocols, and reaches the host. Main queue only.
#pragma once

#include "extension/VKVideoEditorExtensionProtocols.h"
#include "platform/hosting/ExtensionContext.h"

#include <memory>

class VKVideoEditorExtensionViewController;

class VKVideoEditorExtensionContext final : public platform::ExtensionContext, public VKVideoEditorExtensionProtocol {
public:
    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }

    static platform::ConnectionInterface _extensionAuxiliaryVendorProtocol();
    static platform::ConnectionInterface _extensionAuxiliaryHostProtocol();
    platform::ConnectionInterface vendorInterface() const override { return _extensionAuxiliaryVendorProtocol(); }
    platform::ConnectionInterface hostInterface() const override { return _extensionAuxiliaryHostProtocol(); }

    std::shared_ptr<VKVideoEditorExtensionViewController> videoEditorExtensionViewController() const;
    /// The host. A message that does not reach it is logged, not repeated. Null without a connection.
    std::shared_ptr<VKVideoEditorExtensionHostProtocol> extensionObjectProxy() const;
};

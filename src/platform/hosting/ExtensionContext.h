/// What an extension knows of its host: the items that it was given, and the connection back. Main queue only, unless
/// said otherwise.
#pragma once

#include "platform/hosting/Connection.h"
#include "platform/hosting/InputItem.h"
#include "platform/hosting/Platform.h"
#include "platform/views/ViewController.h"
#include "runtime/Object.h"

#include <memory>
#include <vector>

namespace platform {

class ExtensionContext : public runtime::Object {
public:
    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    const std::vector<InputItem>& inputItems() const { return here(m_inputItems); }
    const Platform& platform() const { return *here(m_platform); }
    std::shared_ptr<AuxiliaryConnection> auxiliaryConnection() const { return here(m_connection); }
    std::shared_ptr<runtime::Object> principalObject() const { return here(m_principalObject).lock(); }

    /// What the extension offers its host, and what it expects of it.
    virtual ConnectionInterface vendorInterface() const { return {}; }
    virtual ConnectionInterface hostInterface() const { return {}; }

    // For the runtime that starts the extension.
    void setUp(const Platform& platform, std::vector<InputItem> inputItems,
               std::shared_ptr<AuxiliaryConnection> connection);
    void setPrincipalObject(const std::shared_ptr<runtime::Object>& object) { here(m_principalObject) = object; }

private:
    const Platform* m_platform = nullptr;
    std::vector<InputItem> m_inputItems;
    std::shared_ptr<AuxiliaryConnection> m_connection;
    std::weak_ptr<runtime::Object> m_principalObject;
};

/// A principal controller: knows the context that it was started in.
class ExtensionViewController : public ViewController {
public:
    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    std::shared_ptr<ExtensionContext> extensionContext() const { return here(m_context); }
    void setExtensionContext(std::shared_ptr<ExtensionContext> context) { here(m_context) = std::move(context); }

private:
    std::shared_ptr<ExtensionContext> m_context;
};

/// An extension as its declaration names it.
struct ExtensionDeclaration {
    std::string contextClass;
    std::string principalClass;
};

struct Extension {
    std::shared_ptr<ExtensionContext> context;
    std::shared_ptr<ExtensionViewController> principal;
};

/// Finds both classes by name, makes one of each and ties them together; the view is not loaded yet. Null members when
/// a class is missing or of another kind.
Extension instantiateExtension(const ExtensionDeclaration& declaration);

} // namespace platform

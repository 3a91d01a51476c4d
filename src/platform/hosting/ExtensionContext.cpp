#include "platform/hosting/ExtensionContext.h"

#include <utility>

namespace platform {

const runtime::Class& ExtensionContext::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<ExtensionContext>("ExtensionContext", &Object::classObject()).build();
    return instance;
}

const runtime::Class& ExtensionContext::isa() const
{
    return classObject();
}

void ExtensionContext::setUp(const Platform& platform, std::vector<InputItem> inputItems,
                             std::shared_ptr<AuxiliaryConnection> connection)
{
    assertHere();
    m_platform = &platform;
    m_inputItems = std::move(inputItems);
    m_connection = std::move(connection);
}

const runtime::Class& ExtensionViewController::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<ExtensionViewController>("ExtensionViewController", &ViewController::classObject())
            .build();
    return instance;
}

const runtime::Class& ExtensionViewController::isa() const
{
    return classObject();
}

Extension instantiateExtension(const ExtensionDeclaration& declaration)
{
    const runtime::Class* contextClass = runtime::Class::named(declaration.contextClass);
    const runtime::Class* principalClass = runtime::Class::named(declaration.principalClass);
    if (!contextClass || !principalClass)
        return {};
    const auto context = std::dynamic_pointer_cast<ExtensionContext>(contextClass->instantiate());
    const auto principal = std::dynamic_pointer_cast<ExtensionViewController>(principalClass->instantiate());
    if (!context || !principal)
        return {};
    context->setPrincipalObject(principal);
    principal->setExtensionContext(context);
    return {context, principal};
}

} // namespace platform

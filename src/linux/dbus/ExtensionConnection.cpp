#include "linux/dbus/ExtensionConnection.h"

#include "linux/dbus/DisconnectWatch.h"
#include "linux/dbus/ExtensionLink.h"
#include "linux/dbus/Protocol.h"
#include "linux/dbus/Wire.h"

#include <QDBusConnection>
#include <QDBusError>
#include <QDBusMessage>

#include <algorithm>
#include <cassert>
#include <mutex>
#include <utility>

namespace dbus {

namespace {

constexpr int kFetchLimitMilliseconds = 10'000;

bool hasType(const std::vector<std::string>& types, std::string_view type)
{
    return type == platform::kGenericDataType || std::find(types.begin(), types.end(), type) != types.end();
}

} // namespace

/// What proxies and providers know of the connection; they hold it weakly.
struct ExtensionConnection::Shared {
    explicit Shared(base::Queue& queue) : mainQueue(queue) {}

    base::Queue& mainQueue;
    std::mutex mutex; // guards what follows; held while the link is called, which never waits
    std::unique_ptr<ExtensionLink> link;
    platform::ConnectionInterface hostInterface;
    std::function<void()> disconnected;
    std::function<void()> sent;
    bool hasEnded = false;

    /// With the mutex held. Any thread; `take` gives the handler, on the main queue, unless the connection was destroyed.
    static void callLater(const std::shared_ptr<Shared>& shared, std::function<void()> (*take)(Shared&))
    {
        shared->mainQueue.post([weak = std::weak_ptr(shared), take] {
            const auto self = weak.lock();
            if (!self)
                return;
            std::function<void()> handler;
            {
                const std::lock_guard lock(self->mutex);
                handler = take(*self);
            }
            if (handler)
                handler();
        });
    }

    static void tellSent(const std::shared_ptr<Shared>& shared)
    {
        callLater(shared, [](Shared& self) { return self.sent; });
    }

    static void tellIfEnded(const std::shared_ptr<Shared>& shared)
    {
        if (shared->hasEnded && shared->disconnected)
            callLater(shared, [](Shared& self) { return std::exchange(self.disconnected, {}); });
    }
};

class ExtensionConnection::Provider final : public platform::ItemProvider {
public:
    Provider(std::weak_ptr<Shared> shared, std::uint32_t item, std::uint32_t attachment, std::vector<std::string> types)
        : m_shared(std::move(shared)), m_item(item), m_attachment(attachment), m_types(std::move(types))
    {
    }

    bool hasItemConformingToTypeIdentifier(std::string_view type) const override { return hasType(m_types, type); }

    void loadItemForTypeIdentifier(std::string_view type, LoadCompletion completion) override
    {
        if (const auto shared = m_shared.lock()) {
            const std::lock_guard lock(shared->mutex);
            if (shared->link) {
                shared->link->load(m_item, m_attachment, std::string(type), std::move(completion));
                return;
            }
        }
        completion({}, base::Error::make(kErrorDomain, kNotConnected, "the connection to the host has ended"));
    }

private:
    std::weak_ptr<Shared> m_shared;
    std::uint32_t m_item;
    std::uint32_t m_attachment;
    std::vector<std::string> m_types;
};

class ExtensionConnection::Proxy final : public platform::RemoteProxy {
public:
    Proxy(std::weak_ptr<Shared> shared, platform::AuxiliaryConnection::ErrorHandler handler)
        : m_shared(std::move(shared)), m_handler(std::move(handler))
    {
    }

    void send(const runtime::Selector& message, const runtime::Arguments& arguments) override
    {
        const auto shared = m_shared.lock();
        if (!shared)
            return;
        const std::lock_guard lock(shared->mutex);
        if (const base::ErrorRef error = sendLocked(shared, message, arguments))
            report(shared, m_handler, error);
    }

private:
    base::ErrorRef sendLocked(const std::shared_ptr<Shared>& shared, const runtime::Selector& message,
                              const runtime::Arguments& arguments) const
    {
        const auto& methods = shared->hostInterface.methods;
        if (std::find(methods.begin(), methods.end(), message) == methods.end())
            return base::Error::make(kErrorDomain, kUnknownMessage, "the host does not answer " + message.name());
        auto call = QDBusMessage::createMethodCall(QString(), QLatin1String(kHostPath),
                                                   toQt(interfaceName(shared->hostInterface.protocol)),
                                                   toQt(memberName(message)));
        for (const runtime::Value& argument : arguments) {
            const auto value = toWire(argument);
            if (!value)
                return value.error();
            call << value.value();
        }
        const auto failed = [weak = m_shared, handler = m_handler](const base::ErrorRef& error) {
            if (const auto living = weak.lock())
                report(living, handler, error);
        };
        if (!shared->link || !shared->link->send(call, failed))
            return base::Error::make(kErrorDomain, kNotConnected, "there is no connection to the host");
        Shared::tellSent(shared);
        return nullptr;
    }

    static void report(const std::shared_ptr<Shared>& shared,
                       const platform::AuxiliaryConnection::ErrorHandler& handler, const base::ErrorRef& error)
    {
        if (!handler)
            return;
        shared->mainQueue.post([weak = std::weak_ptr(shared), handler, error] {
            if (!weak.expired())
                handler(error);
        });
    }

    std::weak_ptr<Shared> m_shared;
    platform::AuxiliaryConnection::ErrorHandler m_handler;
};

ExtensionConnection::ExtensionConnection(base::Queue& mainQueue) : m_shared(std::make_shared<Shared>(mainQueue))
{
    registerWireTypes();
}

ExtensionConnection::~ExtensionConnection()
{
    flush();
    // Ended without the mutex: completions run then, and may ask for more.
    const auto link = [this] {
        const std::lock_guard lock(m_shared->mutex);
        return std::move(m_shared->link);
    }();
}

base::Result<void> ExtensionConnection::connect(const std::string& address)
{
    assert(!m_shared->link);
    const QString name = newConnectionName();
    const auto connection = QDBusConnection::connectToPeer(toQt(address), name);
    if (!connection.isConnected()) {
        const QString why = connection.lastError().message();
        QDBusConnection::disconnectFromPeer(name);
        return base::Error::make(kErrorDomain, kNotConnected,
                                 "cannot reach the host at " + address + ": " + fromQt(why));
    }
    auto link = std::make_unique<ExtensionLink>(connection, [weak = std::weak_ptr(m_shared)] {
        if (const auto shared = weak.lock()) {
            const std::lock_guard lock(shared->mutex);
            shared->hasEnded = true;
            Shared::tellIfEnded(shared);
        }
    });
    const std::lock_guard lock(m_shared->mutex);
    m_shared->link = std::move(link);
    return {};
}

void ExtensionConnection::setDisconnectedHandler(std::function<void()> handler)
{
    const std::lock_guard lock(m_shared->mutex);
    m_shared->disconnected = std::move(handler);
    Shared::tellIfEnded(m_shared);
}

void ExtensionConnection::setSentHandler(std::function<void()> handler)
{
    const std::lock_guard lock(m_shared->mutex);
    m_shared->sent = std::move(handler);
}

base::Result<std::vector<platform::InputItem>> ExtensionConnection::inputItems()
{
    if (m_fetched)
        return m_items;
    if (!m_shared->link)
        return base::Error::make(kErrorDomain, kNotConnected, "there is no connection to the host");
    const auto call = QDBusMessage::createMethodCall(QString(), QLatin1String(kHostPath),
                                                     QLatin1String(kRuntimeInterface), QStringLiteral("InputItems"));
    const QDBusMessage reply = m_shared->link->connection().call(call, QDBus::Block, kFetchLimitMilliseconds);
    const auto items = itemsFromReply(reply);
    if (!items)
        return items.error();
    for (const WireItem& wire : items.value()) {
        platform::InputItem item{fromQt(wire.title), {}};
        for (const QStringList& types : wire.attachments)
            item.attachments.push_back(std::make_shared<Provider>(m_shared, static_cast<std::uint32_t>(m_items.size()),
                                                                  static_cast<std::uint32_t>(item.attachments.size()),
                                                                  fromQt(types)));
        m_items.push_back(std::move(item));
    }
    m_fetched = true;
    return m_items;
}

void ExtensionConnection::setHostInterface(platform::ConnectionInterface hostInterface)
{
    const std::lock_guard lock(m_shared->mutex);
    m_shared->hostInterface = std::move(hostInterface);
}

std::shared_ptr<platform::RemoteProxy> ExtensionConnection::remoteObjectProxyWithErrorHandler(ErrorHandler handler)
{
    return std::make_shared<Proxy>(m_shared, std::move(handler));
}

bool ExtensionConnection::flush(std::chrono::milliseconds limit)
{
    return !m_shared->link || m_shared->link->flush(limit);
}

} // namespace dbus

#include "linux/dbus/HostConnection.h"

#include "base/SharedValue.h"
#include "linux/dbus/DisconnectWatch.h"
#include "linux/dbus/Protocol.h"
#include "linux/dbus/Wire.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusServer>
#include <QDBusVariant>
#include <QDBusVirtualObject>

#include <optional>
#include <utility>

namespace dbus {

namespace {

const char* const kIntrospection = R"XML(
  <interface name="org.clipsa.ExtensionRuntime1">
    <method name="InputItems"><arg direction="out" type="a(saas)"/></method>
    <method name="LoadItem">
      <arg direction="in" type="u" name="item"/><arg direction="in" type="u" name="attachment"/>
      <arg direction="in" type="s" name="type"/><arg direction="out" type="v"/>
    </method>
  </interface>
  <interface name="org.clipsa.VKVideoEditorExtensionHostProtocol">
    <method name="ExtensionDidFinishWithActivityTypes"><arg direction="in" type="as" name="activityTypes"/></method>
  </interface>
)XML";

const char* const kHostInterface = "org.clipsa.VKVideoEditorExtensionHostProtocol";

/// "unix:path=" with everything escaped that an address cannot hold as it is.
QString addressOf(const std::string& path)
{
    const auto bytes = QByteArray::fromStdString(path);
    return QStringLiteral("unix:path=") + QString::fromLatin1(bytes.toPercentEncoding("/", "~"));
}

} // namespace

HostAttachment HostAttachment::of(runtime::Value value, std::string type)
{
    return {{platform::kGenericDataType, std::move(type)},
            [value = std::move(value)](const LoadedItem& answer) { answer(value); }};
}

struct HostConnection::State final : QDBusVirtualObject {
    State(const QString& address, std::vector<HostItem> hostItems, Handlers hostHandlers)
        : items(std::move(hostItems)), handlers(std::move(hostHandlers)), server(address), watch([this] {
              if (const auto disconnected = std::exchange(handlers.disconnected, {}))
                  disconnected();
          })
    {
        connect(&server, &QDBusServer::newConnection, this, &State::accept);
    }

    ~State() override { close(); }

    void accept(QDBusConnection connection)
    {
        if (accepted) {
            QDBusConnection::disconnectFromPeer(connection.name());
            return;
        }
        accepted = true;
        peer->setValue(connection);
        connection.registerVirtualObject(QLatin1String(kHostPath), this);
        watch.watch(connection);
        if (handlers.editorConnected)
            handlers.editorConnected();
    }

    void close()
    {
        accepted = true;
        handlers = {};
        const auto connection = peer->value();
        peer->setValue(std::nullopt);
        if (!connection)
            return;
        watch.forget(*connection);
        QDBusConnection(*connection).unregisterObject(QLatin1String(kHostPath));
        QDBusConnection::disconnectFromPeer(connection->name());
    }

    QString introspect(const QString& path) const override
    {
        return path == QLatin1String(kHostPath) ? QString::fromLatin1(kIntrospection) : QString();
    }

    bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override
    {
        if (!peer->value())
            return false;
        const QString call = message.interface() + u'.' + message.member() + u'(' + message.signature() + u')';
        if (call == QLatin1String(kRuntimeInterface) + QStringLiteral(".InputItems()"))
            connection.send(message.createReply(QVariant::fromValue(wireItems())));
        else if (call == QLatin1String(kRuntimeInterface) + QStringLiteral(".LoadItem(uus)"))
            load(message, connection);
        else if (call == QLatin1String(kHostInterface) + QStringLiteral(".ExtensionDidFinishWithActivityTypes(as)"))
            finish(message, connection);
        else
            return false;
        return true;
    }

    void finish(const QDBusMessage& message, const QDBusConnection& connection)
    {
        if (message.isReplyRequired())
            connection.send(message.createReply());
        if (const auto finished = std::exchange(handlers.finished, {}))
            finished(fromQt(message.arguments().constFirst().toStringList()));
    }

    QList<WireItem> wireItems() const
    {
        QList<WireItem> list;
        for (const HostItem& item : items) {
            WireItem wire{toQt(item.title), {}};
            for (const HostAttachment& attachment : item.attachments)
                wire.attachments.append(toQt(attachment.types));
            list.append(wire);
        }
        return list;
    }

    void load(const QDBusMessage& message, const QDBusConnection& connection)
    {
        const auto item = message.arguments().at(0).toUInt();
        const auto attachment = message.arguments().at(1).toUInt();
        if (item >= items.size() || attachment >= items[item].attachments.size()) {
            connection.send(message.createErrorReply(QDBusError::InvalidArgs, QStringLiteral("there is no such item")));
            return;
        }
        // Not by the connection's name: Qt gives it to a later one, and takes that away with our server. Nor is it held: it
        // stays open then, and an answer can be long in coming.
        items[item].attachments[attachment].load(
            [message, weak = std::weak_ptr(peer)](const base::Result<runtime::Value>& loaded) {
                const auto held = weak.lock();
                const auto open = held ? held->value() : std::nullopt;
                if (!open)
                    return;
                const auto value = loaded ? toWire(loaded.value()) : base::Result<QVariant>(loaded.error());
                open->send(value ? message.createReply(QVariant::fromValue(QDBusVariant(value.value())))
                                 : message.createErrorReply(QDBusError::Failed, toQt(value.error()->description())));
            });
    }

    std::vector<HostItem> items;
    Handlers handlers;
    QDBusServer server;
    DisconnectWatch watch;
    /// To the editor while it is connected; answers can come from other threads, and when all this is gone.
    const std::shared_ptr<base::SharedValue<std::optional<QDBusConnection>>> peer =
        std::make_shared<base::SharedValue<std::optional<QDBusConnection>>>();
    bool accepted = false;
};

HostConnection::HostConnection(std::unique_ptr<State> state) : m_state(std::move(state)) {}

HostConnection::~HostConnection()
{
    m_affinity.assertHere();
}

base::Result<std::unique_ptr<HostConnection>> HostConnection::listen(const std::string& path,
                                                                     std::vector<HostItem> items, Handlers handlers)
{
    registerWireTypes();
    if (path.size() > kMaximumPathSize)
        return base::Error::make(kErrorDomain, kTooLarge, "the path is too long for a socket: " + path);
    auto state = std::make_unique<State>(addressOf(path), std::move(items), std::move(handlers));
    if (!state->server.isConnected())
        return base::Error::make(kErrorDomain, kNotConnected,
                                 "cannot listen at " + path + ": " + fromQt(state->server.lastError().message()));
    return std::unique_ptr<HostConnection>(new HostConnection(std::move(state)));
}

std::string HostConnection::address() const
{
    m_affinity.assertHere();
    return fromQt(m_state->server.address());
}

void HostConnection::disconnectEditor()
{
    m_affinity.assertHere();
    m_state->close();
}

} // namespace dbus

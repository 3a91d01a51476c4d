#include "linux/portals/PortalRequest.h"

#include <QDBusArgument>
#include <QDBusObjectPath>
#include <QRandomGenerator>

#include <utility>

namespace portals {

namespace {

constexpr const char* kRequest = "org.freedesktop.portal.Request";

/// Nobody else on the bus can guess it.
QString newToken()
{
    return QStringLiteral("clipsa_%1").arg(QRandomGenerator::system()->generate64(), 0, 16);
}

QString requestPath(const QDBusConnection& bus, const QString& token)
{
    QString sender = bus.baseService().mid(1);
    sender.replace(QLatin1Char('.'), QLatin1Char('_'));
    return QLatin1String(kPath) + QStringLiteral("/request/") + sender + QLatin1Char('/') + token;
}

void close(const QDBusConnection& bus, const QString& owner, const QString& path)
{
    bus.send(bus::question(owner, path, kRequest, "Close"));
}

std::string describe(const QDBusMessage& error)
{
    return (error.errorName() + QStringLiteral(": ") + error.errorMessage()).toStdString();
}

} // namespace

PortalRequest::PortalRequest(std::shared_ptr<Portal> portal, Call call, Ended ended)
    : m_portal(std::move(portal)), m_call(std::move(call)), m_ended(std::move(ended)),
      m_calls(m_portal->system().mainQueue)
{
    m_signals.responded = [this](const QDBusMessage& response) { respond(response); };
    m_signals.ownerChanged = [this](const QDBusMessage& change) {
        if (change.arguments().at(2).toString().isEmpty())
            end(End::Vanished, "the portal has left the bus");
    };
    m_signals.busEnded = [this] { end(End::Vanished, "the bus has ended"); };
    m_portal->system().mainQueue.postAfter(kCallLimit, [this, alive = std::weak_ptr(m_alive)] {
        if (alive.lock() && !m_isAsked)
            end(End::NoAnswer, "the bus or the portal did not answer in time");
    });
    m_portal->bus().use([this, alive = std::weak_ptr(m_alive)](const QDBusConnection& bus) {
        if (alive.lock() && !m_isOver)
            findPortal(bus);
    });
}

PortalRequest::~PortalRequest()
{
    m_affinity.assertHere();
    if (m_isAsked && !m_isOver)
        close(m_bus, m_owner, m_path);
}

void PortalRequest::findPortal(const QDBusConnection& bus)
{
    if (!bus.isConnected()) {
        end(End::NoAnswer, "there is no session bus");
        return;
    }
    m_bus = bus;
    // It may have been started, and have left again, since it was asked what it can do.
    const auto start = bus::questionToBus("StartServiceByName", {QLatin1String(kService), 0U});
    m_calls.ask(bus, start, kCallLimit, [this](const QDBusMessage&) {
        const auto who = bus::questionToBus("GetNameOwner", {QLatin1String(kService)});
        m_calls.ask(m_bus, who, kCallLimit, [this](const QDBusMessage& reply) {
            if (m_isOver)
                return;
            if (bus::isReply(reply, "s"))
                ask(m_bus, reply.arguments().constFirst().toString());
            else
                end(End::NoAnswer, "there is no portal: " + describe(reply));
        });
    });
}

void PortalRequest::ask(const QDBusConnection& bus, const QString& owner)
{
    const QString token = newToken();
    m_owner = owner;
    listen(requestPath(bus, token));
    m_signals.listenToOwner(bus, owner);

    QVariantMap options = m_call.options;
    options.insert(QStringLiteral("handle_token"), token);
    const QVariantList arguments =
        QVariantList{QString::fromStdString(m_portal->parentWindow())} + m_call.arguments + QVariantList{options};
    m_isAsked = true;
    // What it opens when nobody waits for it any more is closed again.
    const auto late = [connection = bus, owner](const QDBusMessage& reply) {
        if (bus::isReply(reply, "o"))
            close(connection, owner, reply.arguments().constFirst().value<QDBusObjectPath>().path());
    };
    m_calls.ask(
        bus, bus::question(owner, QLatin1String(kPath), m_call.interface, m_call.member, arguments), kCallLimit,
        [this](const QDBusMessage& reply) { answered(reply); }, late);
    m_call = {};
}

void PortalRequest::listen(const QString& path)
{
    m_path = path;
    m_signals.listenToRequest(m_bus, m_owner, path);
}

void PortalRequest::answered(const QDBusMessage& reply)
{
    if (m_isOver) // portals may respond before they answer
        return;
    if (reply.type() == QDBusMessage::ErrorMessage
        && reply.errorName() == QDBusError::errorString(QDBusError::TimedOut))
        end(End::NoAnswer, "the portal did not answer the call");
    else if (!bus::isReply(reply, "o"))
        end(End::Refused, reply.type() == QDBusMessage::ErrorMessage ? describe(reply) : "its answer is no request");
    else if (const QString path = reply.arguments().constFirst().value<QDBusObjectPath>().path(); path != m_path)
        listen(path); // old portals choose it themselves
}

void PortalRequest::respond(const QDBusMessage& response)
{
    if (response.signature() != QLatin1String("ua{sv}")) {
        end(End::Refused, "its response has no meaning");
        return;
    }
    const unsigned code = response.arguments().at(0).toUInt();
    switch (code) {
    case 0:
        end(End::Done, {}, qdbus_cast<QVariantMap>(response.arguments().at(1)));
        break;
    case 1:
        end(End::Cancelled, "the user cancelled it");
        break;
    default:
        end(End::Refused, "its response is " + std::to_string(code));
        break;
    }
}

void PortalRequest::end(End how, std::string reason, QVariantMap results)
{
    if (std::exchange(m_isOver, true))
        return;
    if (m_isAsked && how == End::NoAnswer)
        close(m_bus, m_owner, m_path); // it may have opened something all the same
    // Later: we are inside of a message that is delivered to this, and this may be let go of then.
    m_portal->system().mainQueue.post(
        [this, alive = std::weak_ptr(m_alive), outcome = Outcome{how, std::move(results), std::move(reason)}] {
            if (!alive.lock())
                return;
            const Ended ended = std::exchange(m_ended, {});
            ended(outcome);
        });
}

} // namespace portals

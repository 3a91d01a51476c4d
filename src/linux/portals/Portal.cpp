#include "linux/portals/Portal.h"

#include <QDBusVariant>

#include <utility>

namespace portals {

struct Portal::Asking {
    std::function<void(const Versions&)> answered;
    Versions versions;
    int open = 0;

    void end()
    {
        if (const auto tell = std::exchange(answered, {}))
            tell(versions);
    }
};

Portal::Portal(const base::System& system, bus::Bus::Connect connect, ParentWindow parentWindow)
    : m_system(system), m_parentWindow(std::move(parentWindow)), m_bus(system.mainQueue, std::move(connect)),
      m_calls(system.mainQueue)
{
}

void Portal::askVersions(std::function<void(const Versions& versions)> answered)
{
    m_affinity.assertHere();
    const auto asking = std::make_shared<Asking>(Asking{std::move(answered), {}, 0});
    // A bus may take its time, too.
    m_system.mainQueue.postAfter(kVersionLimit, [weak = std::weak_ptr(asking)] {
        if (const auto late = weak.lock())
            late->end();
    });
    m_bus.use([this, asking](const QDBusConnection& connection) {
        if (!asking->answered)
            return;
        if (!connection.isConnected()) {
            asking->end();
            return;
        }
        for (const char* interface : {kEmail, kOpenUri, kFileChooser}) {
            auto question =
                bus::question(QLatin1String(kService), QLatin1String(kPath), "org.freedesktop.DBus.Properties", "Get",
                              {QLatin1String(interface), QStringLiteral("version")});
            question.setAutoStartService(true);
            ++asking->open;
            m_calls.ask(connection, question, kVersionLimit, [asking, interface](const QDBusMessage& reply) {
                if (bus::isReply(reply, "v")) {
                    const QVariant version = reply.arguments().constFirst().value<QDBusVariant>().variant();
                    if (version.metaType() == QMetaType::fromType<unsigned>())
                        asking->versions.emplace(interface, version.toUInt());
                }
                if (--asking->open == 0)
                    asking->end();
            });
        }
    });
}

} // namespace portals

// What kind of machine this is, as the system bus tells it.
#include "linux/dbus/Chassis.h"

#include "support/EventLoop.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVariant>
#include <QDBusVirtualObject>

#include <gtest/gtest.h>

#include <chrono>
#include <optional>

namespace {

/// hostnamed, as far as anybody here asks it.
class HostNameService final : public QDBusVirtualObject {
public:
    QString introspect(const QString&) const override { return {}; }
    bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override
    {
        if (silent)
            return true;
        if (message.arguments() != QVariantList{QStringLiteral("org.freedesktop.hostname1"), QStringLiteral("Chassis")})
            return false;
        if (!chassis.isValid())
            return connection.send(message.createReply());
        return connection.send(message.createReply(QVariant::fromValue(QDBusVariant(chassis))));
    }

    QVariant chassis;
    bool silent = false;
};

TEST(Chassis, IsWhatTheHostNameServiceSays)
{
    auto connection = QDBusConnection::connectToBus(QDBusConnection::SystemBus, QStringLiteral("hostnamed"));
    HostNameService service;
    EXPECT_FALSE(dbus::chassis()) << "nobody is there to ask";

    ASSERT_TRUE(connection.registerVirtualObject(QStringLiteral("/org/freedesktop/hostname1"), &service));
    ASSERT_TRUE(connection.registerService(QStringLiteral("org.freedesktop.hostname1")));
    const auto ask = [](std::chrono::milliseconds limit = std::chrono::seconds(20)) {
        return tests::whilePumping([limit] { return dbus::chassis(limit); });
    };
    service.chassis = QStringLiteral("handset");
    EXPECT_EQ(ask(), "handset");
    service.chassis = QStringLiteral("");
    EXPECT_EQ(ask(), std::nullopt);
    service.chassis = 7;
    EXPECT_EQ(ask(), std::nullopt);
    service.chassis = QVariant();
    EXPECT_EQ(ask(), std::nullopt) << "it answers with nothing at all";
    service.silent = true;
    EXPECT_EQ(ask(std::chrono::milliseconds(20)), std::nullopt);
}

} // namespace

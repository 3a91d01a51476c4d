// What the host answers to whoever is connected, call by call.
#include "Connected.h"

#include <QDBusConnection>
#include <QDBusMessage>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

/// Connected, but with words of its own.
class TheHostOnTheWire : public Connected {
protected:
    void SetUp() override
    {
        listen({text("one", "1")});
        m_raw.emplace(QDBusConnection::connectToPeer(QString::fromStdString(m_host->address()), QStringLiteral("raw")));
        ASSERT_TRUE(tests::pumpUntil([&] { return m_connects > 0; }));
    }
    void TearDown() override
    {
        m_raw.reset();
        QDBusConnection::disconnectFromPeer(QStringLiteral("raw"));
    }

    QDBusMessage call(const char* interface, const char* member, const QVariantList& arguments = {},
                      const char* path = dbus::kHostPath)
    {
        auto message = QDBusMessage::createMethodCall(QString(), QLatin1String(path), QLatin1String(interface),
                                                      QLatin1String(member));
        message.setArguments(arguments);
        return tests::whilePumping([&] { return m_raw->call(message, QDBus::Block, 20'000); });
    }
    std::string errorOf(const QDBusMessage& reply)
    {
        return reply.type() == QDBusMessage::ErrorMessage ? reply.errorName().toStdString() : "";
    }

    static constexpr const char* kHostInterface = "org.clipsa.VKVideoEditorExtensionHostProtocol";
    static constexpr const char* kFinished = "ExtensionDidFinishWithActivityTypes";
    static constexpr const char* kUnknown = "org.freedesktop.DBus.Error.Unknown";

    std::optional<QDBusConnection> m_raw;
};

TEST_F(TheHostOnTheWire, AnswersItsOwnCallsOnly)
{
    EXPECT_EQ(errorOf(call(dbus::kRuntimeInterface, "InputItems")), "");
    EXPECT_EQ(errorOf(call(dbus::kRuntimeInterface, "LoadItem", {0U, 0U, QStringLiteral("text/plain")})), "");
    EXPECT_EQ(errorOf(call(kHostInterface, kFinished, {QStringList{QStringLiteral("a")}})), "");
    EXPECT_THAT(m_finished, ElementsAre(ElementsAre("a")));

    const QVariantList types = {QStringList{QStringLiteral("b")}};
    const QDBusMessage wrong[] = {
        call(dbus::kRuntimeInterface, "InputItems", {1}),
        call(dbus::kRuntimeInterface, "OutputItems"),
        call(dbus::kRuntimeInterface, "LoadItem", {0U, 0U}),
        call(dbus::kRuntimeInterface, "LoadItem", {QStringLiteral("0"), 0U, QStringLiteral("text/plain")}),
        call(dbus::kRuntimeInterface, "UnloadItem", {0U, 0U, QStringLiteral("text/plain")}),
        call("org.clipsa.Another", "InputItems"),
        call("org.clipsa.Another", kFinished, types),
        call(kHostInterface, "ExtensionDidBegin", types),
        call(kHostInterface, kFinished, {QStringLiteral("b")}),
        call(kHostInterface, kFinished),
        call(dbus::kRuntimeInterface, kFinished, types),
    };
    for (const QDBusMessage& reply : wrong)
        EXPECT_THAT(errorOf(reply), testing::StartsWith(kUnknown));
    EXPECT_NE(errorOf(call(dbus::kRuntimeInterface, "InputItems", {}, "/org/clipsa")), "");
    EXPECT_NE(errorOf(call(kHostInterface, kFinished, types, "/org/clipsa/Host/below")), "");
    EXPECT_THAT(m_finished, ElementsAre(ElementsAre("a")));
}

TEST_F(TheHostOnTheWire, HasNoItemsButThoseThatItTellsOf)
{
    for (const auto& [item, attachment] : {std::pair(1U, 0U), {0U, 1U}, {~0U, 0U}, {0U, ~0U}})
        EXPECT_EQ(errorOf(call(dbus::kRuntimeInterface, "LoadItem", {item, attachment, QStringLiteral("text/plain")})),
                  "org.freedesktop.DBus.Error.InvalidArgs");
}

TEST_F(TheHostOnTheWire, DescribesItself)
{
    const auto described = [&](const char* path) {
        return call("org.freedesktop.DBus.Introspectable", "Introspect", {}, path)
            .arguments()
            .value(0)
            .toString()
            .toStdString();
    };
    EXPECT_THAT(described(dbus::kHostPath), HasSubstr("<interface name=\"org.clipsa.ExtensionRuntime1\">"));
    EXPECT_THAT(described("/org/clipsa"), Not(HasSubstr("org.clipsa.ExtensionRuntime1")));
}

TEST_F(TheHostOnTheWire, AnswersNobodyWhomItHasClosed)
{
    m_host->disconnectEditor();
    EXPECT_NE(errorOf(call(kHostInterface, kFinished, {QStringList{}})), "");
    EXPECT_THAT(m_finished, IsEmpty());
}

} // namespace

// What is told of a connection, and what no more, when either side goes.
#include "Connected.h"

#include "linux/dbus/DisconnectWatch.h"

#include <QDBusConnection>
#include <QDBusServer>
#include <QTimer>

#include <atomic>
#include <future>
#include <optional>

using testing::IsEmpty;
using testing::SizeIs;

namespace {

class TheEndOfAConnection : public Connected {
protected:
    std::shared_ptr<platform::RemoteProxy> proxy()
    {
        return m_extension->remoteObjectProxyWithErrorHandler(
            [this](const base::ErrorRef& error) { m_errors.push_back(error); });
    }
    void finish() { proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"x"})}); }
    /// As its owner does; it waits for what was sent.
    void destroyExtension()
    {
        tests::whilePumping([&] {
            m_extension.reset();
            return true;
        });
    }

    std::vector<base::ErrorRef> m_errors;
};

TEST_F(TheEndOfAConnection, IsNotToldBeforeItComes)
{
    connect({text("t", "v")});
    int gone = 0;
    m_extension->setDisconnectedHandler([&] { ++gone; });
    finish();
    EXPECT_EQ(load(0).text(), "v");
    m_mainQueue.drain();
    EXPECT_EQ(gone, 0);
    EXPECT_EQ(m_hostDisconnects, 0);
}

TEST_F(TheEndOfAConnection, SilencesWhatItsOwnerWasToBeTold)
{
    connect({});
    int told = 0;
    m_extension->setSentHandler([&] { ++told; });
    finish();
    proxy()->send(runtime::Selector("explode:"), {});
    destroyExtension();
    m_mainQueue.drain();
    EXPECT_EQ(told, 0);
    EXPECT_THAT(m_errors, IsEmpty());
}

TEST_F(TheEndOfAConnection, IsNotToldToAnOwnerThatHasLetItGo)
{
    connect({});
    bool told = false;
    std::atomic<bool> posted = false;
    m_extension->setDisconnectedHandler([&] { told = true; });
    m_mainQueue.setWake([&, dispatcher = QAbstractEventDispatcher::instance()] {
        posted = true;
        dispatcher->wakeUp();
    });
    m_host.reset();
    ASSERT_TRUE(tests::pumpUntil([&] { return posted.load(); }));
    m_mainQueue.setWake({});
    m_extension.reset();
    m_mainQueue.drain();
    EXPECT_FALSE(told);
}

TEST_F(TheEndOfAConnection, LeavesTheListThatWasFetched)
{
    connect({text("one", "1"), text("two", "2")});
    m_host.reset();
    const auto again = m_extension->inputItems();
    ASSERT_TRUE(again) << again.error()->description();
    EXPECT_THAT(again.value(), SizeIs(2)) << "and each of it once";
}

TEST_F(TheEndOfAConnection, IsNoneWhereAMessageFails)
{
    connect({});
    proxy()->send(runtime::Selector("explode:"), {});
    EXPECT_THAT(m_errors, IsEmpty()) << "told on the main queue, never from inside";
    m_mainQueue.drain();
    EXPECT_THAT(m_errors, SizeIs(1));
    // Nobody needs to listen.
    m_extension->remoteObjectProxyWithErrorHandler({})->send(runtime::Selector("explode:"), {});
    m_mainQueue.drain();
    finish();
    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return !m_finished.empty(); }));
}

TEST_F(TheEndOfAConnection, IsNotTakenForTheHostsOwnDoing)
{
    connect({text("t", "v")});
    m_host->disconnectEditor();
    bool gone = false;
    m_extension->setDisconnectedHandler([&] { gone = true; });
    ASSERT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return gone; }));
    // Nobody else is let in, and nobody is told of anything.
    dbus::ExtensionConnection late(m_mainQueue);
    bool refused = false;
    late.setDisconnectedHandler([&] { refused = true; });
    if (late.connect(m_host->address())) {
        EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return refused; }));
    }
    EXPECT_EQ(m_connects, 1);
    EXPECT_EQ(m_hostDisconnects, 0);
}

TEST_F(TheEndOfAConnection, CanComeBeforeItsBeginning)
{
    listen({});
    m_host->disconnectEditor();
    dbus::ExtensionConnection late(m_mainQueue);
    bool refused = false;
    late.setDisconnectedHandler([&] { refused = true; });
    if (late.connect(m_host->address())) {
        EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return refused; }));
    }
    EXPECT_EQ(m_connects, 0);
}

TEST_F(TheEndOfAConnection, IsNoAnswerToALateLoad)
{
    dbus::LoadedItem answerLater;
    dbus::HostAttachment slow;
    slow.load = [&](dbus::LoadedItem answer) { answerLater = std::move(answer); };
    connect({{"slow", {slow}}});
    std::atomic<int> completions = 0;
    m_items[0].attachments[0]->loadItemForTypeIdentifier(
        platform::kGenericDataType, [&](const runtime::Value&, const base::ErrorRef&) { ++completions; });
    ASSERT_TRUE(tests::pumpUntil([&] { return static_cast<bool>(answerLater); }));
    m_extension.reset();
    EXPECT_EQ(completions, 1);
    ASSERT_TRUE(tests::pumpUntil([&] { return m_hostDisconnects > 0; }));
    answerLater(runtime::toValue("nobody hears it"));
    m_host.reset();
    answerLater(runtime::toValue("nor this"));
    EXPECT_EQ(completions, 1);
}

TEST_F(TheEndOfAConnection, IsToldWhenNothingIsBeingLoadedAnyMore)
{
    bool asked = false;
    dbus::HostAttachment never;
    never.load = [&](const dbus::LoadedItem&) { asked = true; };
    connect({{"never", {never}}});
    std::atomic<bool> told = false;
    std::promise<bool> toldBefore;
    bool gone = false;
    m_extension->setDisconnectedHandler([&] { gone = true; });
    m_items[0].attachments[0]->loadItemForTypeIdentifier(
        platform::kGenericDataType, [&](const runtime::Value&, const base::ErrorRef&) { toldBefore.set_value(told); });
    ASSERT_TRUE(tests::pumpUntil([&] { return asked; }));
    m_mainQueue.setWake([&] { told = true; });
    m_host.reset();
    EXPECT_FALSE(toldBefore.get_future().get());
    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return gone; }));
}

TEST_F(TheEndOfAConnection, IsNoticedByWhoBeginsToWatchTooLate)
{
    QDBusServer server(QStringLiteral("unix:path=") + QString::fromStdString((m_directory.path() / "late").native()));
    std::optional<QDBusConnection> accepted;
    QObject::connect(&server, &QDBusServer::newConnection, &server,
                     [&](const QDBusConnection& peer) { accepted = peer; });
    const auto connection = QDBusConnection::connectToPeer(server.address(), QStringLiteral("late"));
    ASSERT_TRUE(tests::pumpUntil([&] { return accepted.has_value(); }));
    const QString name = accepted->name();
    accepted.reset(); // it stays open as long as it is held
    QDBusConnection::disconnectFromPeer(name);
    QTimer look; // nothing else wakes this loop: nobody watches yet
    look.start(1);
    ASSERT_TRUE(tests::pumpUntil([&] { return !connection.isConnected(); }));
    look.stop();
    int told = 0;
    dbus::DisconnectWatch watch([&] { ++told; });
    watch.watch(connection);
    EXPECT_EQ(told, 0) << "not before it returns";
    EXPECT_TRUE(tests::pumpUntil([&] { return told > 0; }));
    QCoreApplication::processEvents();
    EXPECT_EQ(told, 1);
    QDBusConnection::disconnectFromPeer(QStringLiteral("late"));
}

} // namespace

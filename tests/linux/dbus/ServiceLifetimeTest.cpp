// When the service leaves, and whom it does not leave waiting.
#include "Recorders.h"

#include <QDBusConnectionInterface>
#include <QTimer>

#include <gmock/gmock.h>

#include <csignal>

using testing::HasSubstr;

namespace {

/// Every timer that was started before and is shorter has its turn first.
void letTimersPassOf(std::chrono::milliseconds length)
{
    bool passed = false;
    QTimer::singleShot(length, Qt::PreciseTimer, [&] { passed = true; });
    EXPECT_TRUE(tests::pumpUntil([&] { return passed; }));
}

TEST_F(Recorders, TheServiceLeavesOnceWhenItHasNothingToDo)
{
    serve(std::chrono::milliseconds(1));
    EXPECT_TRUE(tests::pumpUntil([&] { return m_idle > 0; }));
    Caller caller;
    EXPECT_FALSE(caller.bus.interface()->isServiceRegistered(kService));
    letTimersPassOf(std::chrono::milliseconds(4));
    EXPECT_EQ(m_idle, 1);
}

TEST_F(Recorders, TheServiceStaysWhileThereIsASession)
{
    constexpr std::chrono::milliseconds kIdle(20);
    serve(kIdle);
    Caller caller;
    int changes = 0;
    QObject::connect(caller.bus.interface(), &QDBusConnectionInterface::serviceOwnerChanged,
                     [&](const QString& name) { changes += name == kService; });
    // Twice: the second comes when the first has ended, and the service thinks of leaving.
    for (std::size_t i = 0; i < 2; ++i) {
        const QDBusPendingCall asked = caller.startEdit(movie());
        caller.bus.interface()->isServiceRegistered(kService); // the bus has passed it on when it answers this
        QDBusPendingCallWatcher pending(asked);
        EXPECT_TRUE(tests::pumpUntil([&] { return pending.isFinished(); }));
        ASSERT_EQ(m_editors.size(), i + 1) << pending.reply().errorMessage().toStdString();
        letTimersPassOf(2 * kIdle);
        EXPECT_TRUE(caller.bus.interface()->isServiceRegistered(kService));
        QCoreApplication::processEvents();
        EXPECT_EQ(m_idle, 0);
        EXPECT_EQ(changes, 0);
        m_editors[i]->events.ended("the editor ended early");
    }
    EXPECT_TRUE(tests::pumpUntil([&] { return m_idle > 0; }));
}

TEST_F(Recorders, ClosingTheServiceClosesItsEditorsFirst)
{
    serve();
    Caller caller;
    edit(caller);
    m_service->close();
    EXPECT_TRUE(m_editors[0]->askedToGo);
    EXPECT_EQ(m_idle, 0);
    EXPECT_EQ(edit(caller).errorName().toStdString(), "org.clipsa.Error.Failed");
    m_editors[0]->events.ended({});
    EXPECT_TRUE(tests::pumpUntil([&] { return m_idle > 0; }));
}

TEST_F(Recorders, AreAnsweredByAServiceThatIsAboutToLeave)
{
    serve();
    Caller caller;
    edit(caller);
    m_service->close();
    const QVariantMap options = {{QStringLiteral("attachment"), QStringLiteral("/notes.txt")}};
    QDBusPendingCallWatcher reply(
        caller.start("org.clipsa.Recorder1", "Edit", {QVariant::fromValue(movie()), options}));
    caller.bus.interface()->isServiceRegistered(kService); // the bus has passed it on when it answers this
    m_editors[0]->events.ended({});
    EXPECT_TRUE(tests::pumpUntil([&] { return m_idle > 0; }));
    EXPECT_TRUE(tests::pumpUntil([&] { return reply.isFinished(); }));
    EXPECT_EQ(reply.error().message().toStdString(), "Clipsa is being closed");
    EXPECT_EQ(m_editors.size(), 1U);
}

TEST_F(Recorders, TheServiceStaysWhileItIsToldWhoCalls)
{
    serve();
    Caller caller;
    edit(caller);
    m_service->close();
    const QVariantMap options = {{QStringLiteral("attachment"), QStringLiteral("/notes.txt")}};
    const auto bus = static_cast<pid_t>(caller.bus.interface()->servicePid(QStringLiteral("org.freedesktop.DBus")));
    const QDBusPendingCall asked =
        caller.start("org.clipsa.Recorder1", "Edit", {QVariant::fromValue(movie()), options});
    caller.bus.interface()->isServiceRegistered(kService); // the bus has passed it on when it answers this
    ASSERT_EQ(::kill(bus, SIGSTOP), 0);
    letTimersPassOf(std::chrono::milliseconds(50)); // the service has asked, and hears nothing
    m_editors[0]->events.ended({});
    ASSERT_TRUE(tests::pumpUntil([&] { return m_editors[0]->gone; }));
    letTimersPassOf(std::chrono::milliseconds(1));
    EXPECT_EQ(m_idle, 0);
    ASSERT_EQ(::kill(bus, SIGCONT), 0);
    EXPECT_TRUE(tests::pumpUntil([&] { return m_idle > 0; }));
    QDBusPendingCallWatcher reply(asked);
    EXPECT_TRUE(tests::pumpUntil([&] { return reply.isFinished(); }));
    EXPECT_EQ(reply.error().message().toStdString(), "Clipsa is being closed");
}

TEST_F(Recorders, OnlyOneServiceHasTheName)
{
    Caller other;
    ASSERT_TRUE(other.bus.registerService(kService));
    const auto second = dbus::RecorderService::start({}, std::chrono::hours(1), {});
    ASSERT_FALSE(second);
    EXPECT_THAT(second.error()->description(), HasSubstr("another clipsa service"));
}

} // namespace

// Recorders on a private bus, and editors that exist only on paper.
#include "linux/dbus/RecorderService.h"

#include "linux/dbus/Chassis.h"
#include "support/EventLoop.h"
#include "support/PrivateDirectory.h"

#include <QDBusConnection>
#include <QDBusConnectionInterface>
#include <QDBusMessage>
#include <QDBusObjectPath>
#include <QDBusPendingCallWatcher>
#include <QDBusUnixFileDescriptor>
#include <QDBusVariant>
#include <QDBusVirtualObject>

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <map>
#include <optional>
#include <sys/stat.h>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

namespace {

const QString kService = QStringLiteral("org.clipsa.Clipsa");
const QString kPath = QStringLiteral("/org/clipsa/Clipsa");

struct PaperEditor {
    dbus::EditRequest request;
    dbus::RecorderService::EditorEvents events;
    bool askedToGo = false;
    bool gone = false;
};

class Editor final : public dbus::RecorderService::Editor {
public:
    explicit Editor(std::shared_ptr<PaperEditor> paper) : m_paper(std::move(paper)) {}
    ~Editor() override { m_paper->gone = true; }
    void close() override { m_paper->askedToGo = true; }

private:
    std::shared_ptr<PaperEditor> m_paper;
};

/// A program of its own on the bus, as far as the bus can tell; writes down the signals that it gets.
class Caller final : public QDBusVirtualObject {
public:
    Caller()
        : m_name(QStringLiteral("caller-%1").arg(++s_count)),
          bus(QDBusConnection::connectToBus(QDBusConnection::SessionBus, m_name))
    {
        // Signals to us alone need no match; what is broadcast would need this one.
        auto match = QDBusMessage::createMethodCall(QStringLiteral("org.freedesktop.DBus"),
                                                    QStringLiteral("/org/freedesktop/DBus"),
                                                    QStringLiteral("org.freedesktop.DBus"), QStringLiteral("AddMatch"));
        bus.call(match << QStringLiteral("interface='org.clipsa.RecorderSession1'"));
    }
    ~Caller() override { leave(); }
    void leave() { QDBusConnection::disconnectFromBus(m_name); }

    QDBusMessage call(const char* interface, const char* member, const QVariantList& arguments,
                      const QString& path = kPath)
    {
        auto message = QDBusMessage::createMethodCall(kService, path, QLatin1String(interface), QLatin1String(member));
        message.setArguments(arguments);
        QDBusPendingCallWatcher pending(bus.asyncCall(message)); // wakes the event loop
        EXPECT_TRUE(tests::pumpUntil([&] { return pending.isFinished(); }));
        return pending.reply();
    }

    QDBusPendingCall startEdit(const QDBusUnixFileDescriptor& movie)
    {
        auto message = QDBusMessage::createMethodCall(kService, kPath, QStringLiteral("org.clipsa.Recorder1"),
                                                      QStringLiteral("Edit"));
        return bus.asyncCall(message << QVariant::fromValue(movie) << QVariantMap());
    }

    QString introspect(const QString&) const override { return {}; }
    bool handleMessage(const QDBusMessage&, const QDBusConnection&) override { return false; }

private:
    inline static int s_count = 0;
    QString m_name;

public:
    QDBusConnection bus;
};

class Recorders : public ::testing::Test {
protected:
    void serve(std::chrono::milliseconds idle = std::chrono::hours(1))
    {
        auto service = dbus::RecorderService::start(
            [this](dbus::EditRequest request, dbus::RecorderService::EditorEvents events) {
                const auto editor =
                    std::make_shared<PaperEditor>(PaperEditor{std::move(request), std::move(events), false, false});
                m_editors.push_back(editor);
                const auto tell = [editor, started = m_refusal ? base::Result<void>(m_refusal) : base::Result<void>()] {
                    editor->events.started(started);
                };
                if (!m_isSlow)
                    QMetaObject::invokeMethod(&m_context, tell, Qt::QueuedConnection);
                return std::make_unique<Editor>(editor);
            },
            idle, [this] { ++m_idle; });
        ASSERT_TRUE(service) << service.error()->description();
        m_service = std::move(service).value();
    }

    /// An open file with some bytes in it.
    QDBusUnixFileDescriptor movie()
    {
        const auto path = m_directory.write("movie.mp4", "moving pictures");
        const posix::FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
        return QDBusUnixFileDescriptor(file.get());
    }

    QDBusMessage edit(Caller& caller, const QVariantMap& options = {})
    {
        return caller.call("org.clipsa.Recorder1", "Edit", {QVariant::fromValue(movie()), options});
    }

    static QString sessionOf(const QDBusMessage& reply)
    {
        return reply.arguments().value(0).value<QDBusObjectPath>().path();
    }

    tests::PrivateDirectory m_directory;
    std::vector<std::shared_ptr<PaperEditor>> m_editors;
    base::ErrorRef m_refusal;
    bool m_isSlow = false; ///< the test itself says when an editor has started
    int m_idle = 0;
    QObject m_context;
    std::unique_ptr<dbus::RecorderService> m_service;
};

TEST_F(Recorders, GetASessionForAnOpenFileAndTheirOptions)
{
    serve();
    Caller caller;
    const auto reply = edit(caller, {{QStringLiteral("app-name"), QStringLiteral("Tux Räcer")},
                                     {QStringLiteral("bundle-id"), QStringLiteral("org.tux.Racer")},
                                     {QStringLiteral("message"), QStringLiteral("look")},
                                     {QStringLiteral("tint"), QStringLiteral("#FF0000")},
                                     {QStringLiteral("name"), QStringLiteral("race.webm")},
                                     {QStringLiteral("attachment"), QStringLiteral("/notes.txt")},
                                     {QStringLiteral("activation-token"), QStringLiteral("token")},
                                     {QStringLiteral("from-the-future"), 42}});

    EXPECT_THAT(sessionOf(reply).toStdString(), StartsWith("/org/clipsa/Clipsa/session/"));
    ASSERT_EQ(m_editors.size(), 1U);
    const dbus::EditRequest& request = m_editors[0]->request;
    EXPECT_EQ(request.appName, "Tux Räcer");
    EXPECT_EQ(request.bundleIdentifier, "org.tux.Racer");
    EXPECT_EQ(request.message, "look");
    EXPECT_EQ(request.tint, (platform::Color{1, 0, 0, 1}));
    EXPECT_EQ(request.movieName, "race.webm");
    EXPECT_EQ(request.attachmentPath, "/notes.txt");
    EXPECT_THAT(request.environment, ElementsAre(std::pair<std::string, std::string>("XDG_ACTIVATION_TOKEN", "token")));

    struct stat sent = {};
    struct stat there = {};
    ASSERT_EQ(::fstat(request.movie.get(), &sent), 0);
    ASSERT_EQ(::stat((m_directory.path() / "movie.mp4").c_str(), &there), 0);
    EXPECT_EQ(sent.st_ino, there.st_ino);
    EXPECT_TRUE(::fcntl(request.movie.get(), F_GETFD) & FD_CLOEXEC);
}

TEST_F(Recorders, CanSendAnAttachmentAsAnOpenFile)
{
    serve();
    Caller caller;
    edit(caller, {{QStringLiteral("attachment"), QVariant::fromValue(movie())}});

    ASSERT_EQ(m_editors.size(), 1U);
    EXPECT_TRUE(m_editors[0]->request.attachment);
    EXPECT_THAT(m_editors[0]->request.attachmentPath, IsEmpty());
}

TEST_F(Recorders, AreToldWhichOptionIsWrong)
{
    serve();
    Caller caller;
    const std::map<QString, QVariant> wrong = {{QStringLiteral("app-name"), 1},
                                               {QStringLiteral("tint"), QStringLiteral("reddish")},
                                               {QStringLiteral("message"), QVariantMap{}},
                                               {QStringLiteral("attachment"), QStringLiteral("relative.txt")},
                                               {QStringLiteral("name"), true}};
    for (const auto& [key, value] : wrong) {
        const auto reply = edit(caller, {{key, value}});
        EXPECT_EQ(reply.errorName().toStdString(), "org.clipsa.Error.BadInput") << key.toStdString();
        EXPECT_THAT(reply.errorMessage().toStdString(), HasSubstr("\"" + key.toStdString() + "\""));
    }
    EXPECT_THAT(m_editors, IsEmpty());
}

TEST_F(Recorders, AreToldWhenThereIsNoEditorToBeHad)
{
    serve();
    Caller caller;
    m_refusal = base::Error::make(dbus::kBadInputDomain, 1, "the movie is empty");
    EXPECT_EQ(edit(caller).errorName().toStdString(), "org.clipsa.Error.BadInput");
    m_refusal = base::Error::make("posix", 28, "no space left");
    const auto reply = edit(caller);
    EXPECT_EQ(reply.errorName().toStdString(), "org.clipsa.Error.Failed");
    EXPECT_EQ(reply.errorMessage().toStdString(), "no space left");
}

TEST_F(Recorders, WaitForTheirOwnSlowFilesOnly)
{
    serve();
    Caller slow;
    m_isSlow = true;
    QDBusPendingCallWatcher reply(slow.startEdit(movie()));
    ASSERT_TRUE(tests::pumpUntil([&] { return m_editors.size() == 1; }));
    m_isSlow = false;
    Caller quick;
    EXPECT_THAT(sessionOf(edit(quick)).toStdString(), StartsWith("/org/clipsa/Clipsa/session/"));
    EXPECT_FALSE(reply.isFinished());

    m_editors[0]->events.started({});
    EXPECT_TRUE(tests::pumpUntil([&] { return reply.isFinished(); }));
    EXPECT_THAT(sessionOf(reply.reply()).toStdString(), StartsWith("/org/clipsa/Clipsa/session/"));
}

TEST_F(Recorders, CanLeaveWhileTheirFileIsWaitedFor)
{
    serve();
    Caller caller;
    m_isSlow = true;
    QDBusPendingCallWatcher reply(caller.startEdit(movie()));
    ASSERT_TRUE(tests::pumpUntil([&] { return m_editors.size() == 1; }));
    caller.leave();
    caller.bus = QDBusConnection(QStringLiteral("none"));
    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[0]->askedToGo; }));
    m_editors[0]->events.started(base::Error::make("posix", ECANCELED, "the editor was closed"));
    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[0]->gone; }));
}

TEST_F(Recorders, HaveEightSessionsAtMost)
{
    serve();
    Caller caller;
    for (int i = 0; i < 8; ++i)
        EXPECT_THAT(sessionOf(edit(caller)).toStdString(), Not(IsEmpty()));
    const auto refused = edit(caller);
    EXPECT_EQ(refused.errorName().toStdString(), "org.clipsa.Error.Failed");
    EXPECT_THAT(refused.errorMessage().toStdString(), HasSubstr("8 recordings open"));
    const QStringList uris = {QStringLiteral("file:///c.webm")};
    EXPECT_EQ(caller.call("org.freedesktop.Application", "Open", {uris, QVariantMap{}}).type(),
              QDBusMessage::ErrorMessage);
    EXPECT_EQ(m_editors.size(), 8U);

    Caller other;
    EXPECT_THAT(sessionOf(edit(other)).toStdString(), Not(IsEmpty()));
    m_editors[3]->events.ended({});
    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[3]->gone; }));
    EXPECT_THAT(sessionOf(edit(caller)).toStdString(), Not(IsEmpty()));
}

TEST_F(Recorders, AWrongSignatureIsNoCall)
{
    serve();
    Caller caller;
    EXPECT_EQ(caller.call("org.clipsa.Recorder1", "Edit", {QStringLiteral("/path"), QVariantMap{}}).type(),
              QDBusMessage::ErrorMessage);
    EXPECT_EQ(caller.call("org.clipsa.Recorder1", "Explode", {}).type(), QDBusMessage::ErrorMessage);
    EXPECT_THAT(m_editors, IsEmpty());
}

TEST_F(Recorders, CloseTheirOwnSessionsOnly)
{
    serve();
    Caller caller;
    Caller other;
    const QString session = sessionOf(edit(caller));

    EXPECT_EQ(other.call("org.clipsa.RecorderSession1", "Close", {}, session).errorName().toStdString(),
              "org.clipsa.Error.BadInput");
    EXPECT_FALSE(m_editors[0]->askedToGo);
    EXPECT_EQ(caller.call("org.clipsa.RecorderSession1", "Close", {}, session).type(), QDBusMessage::ReplyMessage);
    EXPECT_TRUE(m_editors[0]->askedToGo);
    EXPECT_EQ(caller.call("org.clipsa.RecorderSession1", "Close", {}, kPath + QStringLiteral("/session/99")).type(),
              QDBusMessage::ErrorMessage);
}

TEST_F(Recorders, WhoLeavesTakesTheirOwnEditorsAlong)
{
    serve();
    Caller caller;
    Caller other;
    edit(caller);
    edit(other);
    edit(caller);
    caller.leave();
    caller.bus = QDBusConnection(QStringLiteral("none"));

    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[0]->askedToGo && m_editors[2]->askedToGo; }));
    EXPECT_FALSE(m_editors[1]->askedToGo);
}

TEST_F(Recorders, SessionsEndWithTheirEditors)
{
    serve();
    Caller caller;
    const QString session = sessionOf(edit(caller));
    m_editors[0]->events.completed({"a"});
    EXPECT_FALSE(m_editors[0]->gone) << "the editor still has to go";
    m_editors[0]->events.ended({});

    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[0]->gone; }));
    EXPECT_EQ(caller.call("org.clipsa.RecorderSession1", "Close", {}, session).type(), QDBusMessage::ErrorMessage);
}

TEST_F(Recorders, TheServiceLeavesWhenItHasNothingToDo)
{
    serve(std::chrono::milliseconds(1));
    EXPECT_TRUE(tests::pumpUntil([&] { return m_idle > 0; }));
    Caller caller;
    EXPECT_FALSE(caller.bus.interface()->isServiceRegistered(kService));
}

TEST_F(Recorders, TheServiceStaysWhileThereIsASession)
{
    serve(std::chrono::milliseconds(300));
    Caller caller;
    edit(caller);
    ASSERT_EQ(m_editors.size(), 1U);
    EXPECT_FALSE(tests::pumpUntil([&] { return m_idle > 0; }, std::chrono::milliseconds(600)));
    m_editors[0]->events.ended("the editor ended early");
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

TEST_F(Recorders, OnlyOneServiceHasTheName)
{
    Caller other;
    ASSERT_TRUE(other.bus.registerService(kService));
    const auto second = dbus::RecorderService::start({}, std::chrono::hours(1), {});
    ASSERT_FALSE(second);
    EXPECT_THAT(second.error()->description(), HasSubstr("another clipsa service"));
}

TEST_F(Recorders, AFileManagerOpensSeveralFiles)
{
    serve();
    Caller caller;
    const QStringList uris = {QStringLiteral("file:///tmp/a%20b.mp4"), QStringLiteral("file:///c.webm")};
    const QVariantMap data = {{QStringLiteral("desktop-startup-id"), QStringLiteral("id")}};
    EXPECT_EQ(caller.call("org.freedesktop.Application", "Open", {uris, data}).type(), QDBusMessage::ReplyMessage);

    ASSERT_EQ(m_editors.size(), 2U);
    EXPECT_EQ(m_editors[0]->request.moviePath, "/tmp/a b.mp4");
    EXPECT_EQ(m_editors[1]->request.moviePath, "/c.webm");
    EXPECT_THAT(m_editors[1]->request.environment,
                ElementsAre(std::pair<std::string, std::string>("DESKTOP_STARTUP_ID", "id")));
    caller.leave();
    caller.bus = QDBusConnection(QStringLiteral("none"));
    Caller next;
    edit(next); // behind the news of the one who left
    EXPECT_FALSE(m_editors[0]->askedToGo) << "nobody in particular asked for this editor";
}

TEST_F(Recorders, ActivatingWithoutAFileIsRefusedInWords)
{
    serve();
    Caller caller;
    EXPECT_THAT(caller.call("org.freedesktop.Application", "Activate", {QVariantMap{}}).errorMessage().toStdString(),
                HasSubstr("give it a recording"));
}

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
    service.silent = true;
    EXPECT_EQ(ask(std::chrono::milliseconds(20)), std::nullopt);
}

} // namespace

// Sessions of recorders with the service.
#include "Recorders.h"

#include <QDBusConnectionInterface>

#include <gmock/gmock.h>

#include <cerrno>
#include <map>
#include <sys/stat.h>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

namespace {

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
    EXPECT_FALSE(m_editors[0]->request.asker) << "whose open files are theirs to give";
}

TEST_F(Recorders, WhoNamesAFileIsKnown)
{
    serve();
    Caller caller;
    edit(caller, {{QStringLiteral("attachment"), QStringLiteral("/notes.txt")},
                  {QStringLiteral("attachment-name"), QStringLiteral("notes")}});
    ASSERT_EQ(m_editors.size(), 1U);
    const auto asker = m_editors[0]->request.asker;
    ASSERT_TRUE(asker);
    struct stat theirs = {};
    struct stat ours = {};
    ASSERT_EQ(::fstat(asker->process.get(), &theirs), 0);
    ASSERT_EQ(::stat(("/proc/" + std::to_string(::getpid())).c_str(), &ours), 0);
    EXPECT_EQ(theirs.st_ino, ours.st_ino);
    EXPECT_EQ(m_editors[0]->request.attachmentName, "notes");
}

TEST_F(Recorders, WhoHasLeftBeforeTheyAreKnownLeavesNoEditorBehind)
{
    serve();
    {
        Caller caller;
        const QDBusPendingCall nobodyWaits = caller.start(
            "org.clipsa.Recorder1", "Edit",
            {QVariant::fromValue(movie()), QVariantMap{{QStringLiteral("attachment"), QStringLiteral("/notes.txt")}}});
        caller.bus.interface()->isServiceRegistered(kService); // the bus has passed it on when it answers this
    }
    ASSERT_TRUE(tests::pumpUntil([&] { return !m_editors.empty(); }));
    ASSERT_TRUE(m_editors[0]->request.asker);
    EXPECT_FALSE(m_editors[0]->request.asker->process);
    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[0]->askedToGo; }));
}

TEST_F(Recorders, AreToldNothingThatIsForTheLog)
{
    serve();
    Caller caller;
    m_refusal = std::make_shared<base::Error>(
        dbus::kBadInputDomain, 1,
        base::Error::UserInfo{{"description", "not to be had"}, {dbus::kUntoldKey, "\n" + std::string(1000, 'x')}});
    testing::internal::CaptureStderr();
    EXPECT_EQ(edit(caller).errorMessage().toStdString(), "not to be had");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "clipsa: not to be had (?" + std::string(500 - 16, 'x') + "\n");
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

TEST_F(Recorders, AreRefusedInTheLogToo)
{
    serve();
    Caller caller;
    testing::internal::CaptureStderr();
    edit(caller, {{QStringLiteral("tint"), QStringLiteral("\x1b[31m\n")}});
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "clipsa: the option \"tint\" must be a colour like #3584e4, not \"?[31m?\"\n");
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
    EXPECT_EQ(caller.call("org.freedesktop.Application", "Open", {QStringLiteral("/path")}).type(),
              QDBusMessage::ErrorMessage);
    EXPECT_EQ(caller.call("org.clipsa.Recorder1", "Explode", {}).type(), QDBusMessage::ErrorMessage);
    EXPECT_THAT(m_editors, IsEmpty());
}

TEST_F(Recorders, ARightSignatureIsNoCallElsewhere)
{
    serve();
    Caller caller;
    const QVariantList edit = {QVariant::fromValue(movie()), QVariantMap{}};
    const QVariantList open = {QStringList{QStringLiteral("file:///race.mp4")}, QVariantMap{}};
    const QString elsewhere = kPath + QStringLiteral("/session/99");
    EXPECT_EQ(caller.call("org.clipsa.Recorder1", "Edit", edit, elsewhere).type(), QDBusMessage::ErrorMessage);
    EXPECT_EQ(caller.call("org.freedesktop.Application", "Open", open, elsewhere).type(), QDBusMessage::ErrorMessage);
    EXPECT_EQ(caller.call("org.clipsa.Recorder1", "Explode", edit).type(), QDBusMessage::ErrorMessage);
    EXPECT_EQ(caller.call("org.freedesktop.Application", "Explode", open).type(), QDBusMessage::ErrorMessage);
    EXPECT_THAT(m_editors, IsEmpty());
}

TEST_F(Recorders, CanAskWhatThereIsToCall)
{
    serve();
    Caller caller;
    const QString session = sessionOf(edit(caller));
    const auto described = [&](const QString& path) {
        return caller.call("org.freedesktop.DBus.Introspectable", "Introspect", {}, path)
            .arguments()
            .value(0)
            .toString()
            .toStdString();
    };
    EXPECT_THAT(described(kPath), HasSubstr("<interface name=\"org.clipsa.Recorder1\">"));
    EXPECT_THAT(described(session), HasSubstr("<interface name=\"org.clipsa.RecorderSession1\">"));
    EXPECT_THAT(described(kPath + QStringLiteral("/session/99")), Not(HasSubstr("RecorderSession1")));
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

TEST_F(Recorders, WhoLeavesAfterOneOfTheirSessionsTakesTheOthersAlong)
{
    serve();
    Caller caller;
    edit(caller);
    edit(caller);
    m_editors[0]->events.ended({});
    ASSERT_TRUE(tests::pumpUntil([&] { return m_editors[0]->gone; }));
    caller.leave();
    caller.bus = QDBusConnection(QStringLiteral("none"));
    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[1]->askedToGo; }));
}

TEST_F(Recorders, WhoHasLeftBeforeTheyAreServedLeavesNoEditorBehind)
{
    serve();
    {
        Caller caller;
        const QDBusPendingCall nobodyWaits = caller.startEdit(movie());
        caller.bus.interface()->isServiceRegistered(kService); // the bus has passed it on when it answers this
    }
    ASSERT_TRUE(tests::pumpUntil([&] { return !m_editors.empty(); }));
    EXPECT_TRUE(tests::pumpUntil([&] { return m_editors[0]->askedToGo; }));
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

} // namespace

// What file managers ask of the service: to open files, without an answer about how that ends.
#include "Recorders.h"

#include <QDBusConnectionInterface>
#include <QTimer>

#include <gmock/gmock.h>

using testing::ElementsAre;
using testing::HasSubstr;

namespace {

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
    for (const auto& editor : m_editors)
        EXPECT_TRUE(editor->request.asker && editor->request.asker->process) << "who names files is known";
    EXPECT_THAT(m_editors[0]->request.editorArguments, ElementsAre("--explain")) << "nobody else is told";
    EXPECT_THAT(m_editors[1]->request.environment,
                ElementsAre(std::pair<std::string, std::string>("DESKTOP_STARTUP_ID", "id")));
    caller.leave();
    caller.bus = QDBusConnection(QStringLiteral("none"));
    Caller next;
    edit(next); // behind the news of the one who left
    EXPECT_FALSE(m_editors[0]->askedToGo) << "nobody in particular asked for this editor";
}

TEST_F(Recorders, AFileManagerIsToldNothingOfItsFiles)
{
    serve();
    Caller caller;
    QTimer heard;
    caller.bus.connect(kService, QString(), QStringLiteral("org.clipsa.RecorderSession1"), QStringLiteral("Ended"),
                       &heard, SLOT(start()));
    const auto isHeard = [&] {
        caller.bus.interface()->isServiceRegistered(kService); // the bus answers behind the signal
        QCoreApplication::processEvents();
        return heard.isActive();
    };
    caller.call("org.freedesktop.Application", "Open", {QStringList{QStringLiteral("file:///a")}, QVariantMap{}});
    m_editors.at(0)->events.ended({});
    EXPECT_FALSE(isHeard());
    edit(caller);
    m_editors.at(1)->events.ended({});
    EXPECT_TRUE(isHeard());
}

TEST_F(Recorders, AFileManagerIsAnsweredOnceWhenAllOfItsFilesHaveBeenLookedAt)
{
    serve();
    Caller caller;
    m_isSlow = true;
    const auto notAMovie = base::Error::make(dbus::kBadInputDomain, 1, "b.mp4 is empty");
    for (const std::size_t bad : {0U, 1U}) {
        const std::size_t first = m_editors.size();
        const QStringList uris = {QStringLiteral("file:///a.mp4"), QStringLiteral("file:///b.mp4")};
        QDBusPendingCallWatcher reply(caller.start("org.freedesktop.Application", "Open", {uris, QVariantMap{}}));
        ASSERT_TRUE(tests::pumpUntil([&] { return m_editors.size() == first + 2; }));
        m_editors[first]->events.started(bad == 0 ? base::Result<void>(notAMovie) : base::Result<void>());
        Caller next;
        next.call("org.freedesktop.Application", "Activate", {QVariantMap{}}); // behind an answer, if there was one
        EXPECT_FALSE(reply.isFinished());
        m_editors[first + 1]->events.started(bad == 1 ? base::Result<void>(notAMovie) : base::Result<void>());
        ASSERT_TRUE(tests::pumpUntil([&] { return reply.isFinished(); }));
        EXPECT_EQ(reply.error().name().toStdString(), "org.clipsa.Error.BadInput") << "file " << bad;
        EXPECT_EQ(reply.error().message().toStdString(), "b.mp4 is empty");
    }
}

TEST_F(Recorders, AFileManagerMayAskForNothingOrForWhatIsNoFile)
{
    serve();
    Caller caller;
    const auto open = [&](const QStringList& uris) {
        return caller.call("org.freedesktop.Application", "Open", {uris, QVariantMap{}}).type();
    };
    EXPECT_EQ(open({}), QDBusMessage::ReplyMessage);
    EXPECT_TRUE(m_editors.empty());
    // Whoever opens it says in words that there is no such file.
    EXPECT_EQ(open({QStringLiteral("https://example.org/a.mp4")}), QDBusMessage::ReplyMessage);
    ASSERT_EQ(m_editors.size(), 1U);
    EXPECT_EQ(m_editors[0]->request.moviePath, "https://example.org/a.mp4");
}

TEST_F(Recorders, ActivatingWithoutAFileIsRefusedInWords)
{
    serve();
    Caller caller;
    EXPECT_THAT(caller.call("org.freedesktop.Application", "Activate", {QVariantMap{}}).errorMessage().toStdString(),
                HasSubstr("give it a recording"));
    EXPECT_THAT(caller
                    .call("org.freedesktop.Application", "ActivateAction",
                          {QStringLiteral("new"), QVariantList(), QVariantMap{}})
                    .errorMessage()
                    .toStdString(),
                HasSubstr("no actions"));
}

} // namespace

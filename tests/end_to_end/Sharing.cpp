// Sharing with the real processes: the movie goes to a mail program, and is there when the editor has gone.
#include "end_to_end/Desktop.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <gmock/gmock.h>

#include <algorithm>

using namespace tests;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

namespace {

namespace fs = std::filesystem;

class Share : public testing::Test {
protected:
    Share() : m_movie(m_machine.movie("clock.mp4")), m_bytes(PrivateDirectory::read(m_movie)) {}
    ~Share() override
    {
        EXPECT_EQ(PrivateDirectory::read(m_movie), m_bytes) << "the user's own file";
        m_desktop.end();
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }

    /// Files in the outbox.
    std::vector<fs::path> outbox() const
    {
        std::vector<fs::path> files;
        const fs::path root = m_machine.outbox();
        if (fs::exists(root))
            for (const auto& entry : fs::recursive_directory_iterator(root))
                if (entry.is_regular_file() && entry.path().filename() != "lock")
                    files.push_back(entry.path());
        std::sort(files.begin(), files.end());
        return files;
    }
    Child::End share(const std::string& steps, const Machine::Words& options = {})
    {
        m_machine.setScript("wait picture\nwait ready\ntap BAR_SHARE\nwait sheet\n" + steps);
        Machine::Words all{"--app-name", "Tux Racer", "--device", "phone"};
        all.insert(all.end(), options.begin(), options.end());
        return m_machine.open(m_movie, all);
    }

    Machine m_machine;
    const fs::path m_movie;
    const std::string m_bytes;
    Desktop m_desktop{m_machine};
};

constexpr const char* kMailAndDone = "tap SHARE_MAIL\nwait editor\ntap BAR_DONE";

} // namespace

TEST_F(Share, ByMailGivesTheMovieToThePortalAndTellsTheHost)
{
    m_desktop.startPortal("done");
    const auto end = share(kMailAndDone);
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(end.out, "Mail\n");
    EXPECT_EQ(m_desktop.received(0), m_bytes);
    EXPECT_FALSE(m_desktop.hasReceived(1)) << "nothing went along";
}

TEST_F(Share, ByMailSendsTheHostsMessageAndItsAttachment)
{
    m_desktop.startPortal("done");
    const fs::path log = m_machine.write("race.log", "third place\n");
    const auto end = share(kMailAndDone, {"--message", "Look at this", "--attachment", log, "--json"});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    const QJsonObject said = QJsonDocument::fromJson(QByteArray::fromStdString(end.out)).object();
    EXPECT_EQ(said["activityTypes"].toArray(), QJsonArray{"Mail"});
    ASSERT_EQ(said["results"].toArray().size(), 1);
    EXPECT_EQ(said["results"].toArray()[0].toObject()["outcome"], "shared");
    EXPECT_EQ(said["results"].toArray()[0].toObject()["type"], "Mail");
    EXPECT_THAT(m_desktop.calls(), HasSubstr("Look at this"));
    EXPECT_EQ(m_desktop.received(0), m_bytes);
    EXPECT_EQ(m_desktop.received(1), "third place\n");
}

TEST_F(Share, ThatTheUserCancelsInTheMailProgramIsNotTold)
{
    m_desktop.startPortal("cancel");
    const auto end = share("tap SHARE_MAIL\nwait file " + (m_desktop.path() / "bytes-0").native()
                           + "\ntap SHARE_CLOSE\nwait editor\ntap BAR_DONE");
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(end.out, IsEmpty());
}

TEST_F(Share, ThatFailsIsToldByAnAlertAndByTheResults)
{
    m_desktop.startPortal("fail");
    const auto end = share("tap SHARE_MAIL\nwait alert\nwait still\ntap SHARE_OK\nwait gone SHARE_OK\ntap "
                           "SHARE_CLOSE\nwait editor\ntap BAR_DONE",
                           {"--json"});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    const QJsonObject said = QJsonDocument::fromJson(QByteArray::fromStdString(end.out)).object();
    EXPECT_EQ(said["activityTypes"].toArray(), QJsonArray());
    ASSERT_EQ(said["results"].toArray().size(), 1);
    EXPECT_EQ(said["results"].toArray()[0].toObject()["outcome"], "not-shared");
    EXPECT_EQ(said["results"].toArray()[0].toObject()["type"], "Mail");
}

TEST_F(Share, ByAMailProgramThatReadsLaterFindsTheMovieWhenTheEditorHasGone)
{
    // No portal, but xdg-email and somebody who takes mail.
    const fs::path program =
        m_machine.write("home/bin/xdg-email", "#!/bin/sh\nprintf '%s\\n' \"$@\" >\"$HOME/mail\"\n");
    fs::permissions(program, fs::perms::owner_all);
    m_machine.write("home/.config/mimeapps.list", "[Default Applications]\nx-scheme-handler/mailto=mail.desktop\n");
    m_machine.write("home/.local/share/applications/mail.desktop",
                    "[Desktop Entry]\nType=Application\nName=Mail\nExec=mail %u\nMimeType=x-scheme-handler/mailto;\n");
    m_machine.set("PATH", (m_machine.home() / "bin").native() + ":" + std::getenv("PATH"));
    const auto end = share(kMailAndDone);
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(end.out, "Mail\n");

    EXPECT_THAT(m_machine.editorDirectories(), IsEmpty()) << "the editor's store";
    ASSERT_THAT(outbox(), SizeIs(1));
    const fs::path kept = outbox().front();
    EXPECT_THAT(kept.filename().native(), testing::StartsWith("Tux Racer 2024-05-17 09-30-00"));
    EXPECT_THAT(PrivateDirectory::read(m_machine.home() / "mail"), HasSubstr(kept.native()));
    EXPECT_EQ(PrivateDirectory::read(kept), m_bytes);
}

TEST_F(Share, FromAShellIsWhatTheSheetOffers)
{
    m_desktop.startPortal("done");
    const auto listed = m_machine.run({"share", m_movie, "--list"});
    EXPECT_EQ(listed.exitStatus, 0) << listed.err;
    EXPECT_EQ(listed.out, "Mail\tMail\nOpenWith\tOpen with…\nSaveACopy\tSave a copy…\nShowInFolder\tShow in folder\n"
                          "SaveToCameraRoll\tSave to Videos\n");

    const auto shared = m_machine.run({"share", m_movie, "--with", "Mail", "--message", "Look at this"});
    EXPECT_EQ(shared.exitStatus, 0) << shared.err;
    EXPECT_THAT(shared.out + shared.err, IsEmpty());
    EXPECT_THAT(m_desktop.calls(), HasSubstr("Look at this"));
    EXPECT_EQ(m_desktop.received(0), m_bytes);
}

TEST_F(Share, FromAShellSaysWhenTheUserCancelsAndWhenNobodyTakesIt)
{
    m_desktop.startPortal("cancel");
    const auto cancelled = m_machine.run({"share", m_movie, "--with", "Mail"});
    EXPECT_EQ(cancelled.exitStatus, 3);
    EXPECT_EQ(cancelled.err, "clipsa: it was cancelled\n");

    const auto unknown = m_machine.run({"share", m_movie, "--with", "Telepathy"});
    EXPECT_EQ(unknown.exitStatus, 1);
    EXPECT_THAT(unknown.err, HasSubstr("nothing here shares by Telepathy"));

    const auto missing = m_machine.run({"share", m_movie.native() + ".not", "--list"});
    EXPECT_EQ(missing.exitStatus, 2);
}

TEST_F(Share, FromAShellSaysInTheUsersWordsWhatWentWrong)
{
    m_desktop.startPortal("fail");
    const auto failed = m_machine.run({"share", m_movie, "--with", "Mail"});
    EXPECT_EQ(failed.exitStatus, 1);
    EXPECT_THAT(failed.err, HasSubstr("cannot share by Mail: its response is 2\n")) << "for who looks for the cause";
    EXPECT_THAT(
        failed.err,
        HasSubstr("\nclipsa: No mail program has taken the movie. Set one up, or share the movie in another way.\n"));
}

TEST_F(Share, GoesOnWithoutABusThatLetsNobodyIn)
{
    m_desktop.freeze();
    const auto end = share("key escape\nwait editor\ntap BAR_DONE", {"--json"});
    EXPECT_TRUE(end.inTime);
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(end.out, HasSubstr(R"("activityTypes":[])")) << "the host has heard of the end";

    const auto listed = m_machine.run({"share", m_movie, "--list"});
    EXPECT_TRUE(listed.inTime);
    EXPECT_EQ(listed.out, "SaveToCameraRoll\tSave to Videos\n");
}

TEST_F(Share, FromAShellEndsWhenTheBusDies)
{
    m_desktop.startPortal("hold");
    Child program = m_machine.start({"share", m_movie, "--with", "Mail"});
    EXPECT_TRUE(m_desktop.waitUntilHeld());
    m_desktop.killBus();
    const auto end = program.wait();
    EXPECT_TRUE(end.inTime);
    EXPECT_EQ(end.exitStatus, 1);
    EXPECT_THAT(end.err, HasSubstr("cannot share by Mail: "));
}

TEST_F(Share, EndsWithTheWindowThatIsClosedAroundTheSheet)
{
    m_desktop.startPortal("hold");
    const std::string pickMail = "tap SHARE_MAIL\nwait file " + (m_desktop.path() / "bytes-0").native() + "\n";
    for (const std::string& before : {std::string(), pickMail}) {
        SCOPED_TRACE(before);
        const auto end = share(before + "close", {"--json"});
        EXPECT_TRUE(end.inTime);
        EXPECT_EQ(end.exitStatus, 0) << end.err;
        EXPECT_THAT(end.out, HasSubstr(R"("activityTypes":[])"));
    }
    EXPECT_THAT(m_desktop.calls(), HasSubstr("\"Close\"")) << "the mail program is not left with half a message";
}

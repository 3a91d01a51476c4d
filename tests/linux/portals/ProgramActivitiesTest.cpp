// Mail and messages by programs that are started for it.

#include "linux/portals/Desktop.h"
#include "linux/portals/MailText.h"
#include "platform/sharing/ActivityTypes.h"

namespace {

using namespace platform;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;
namespace fs = std::filesystem;
using tests::PrivateDirectory;

class Programs : public tests::Desktop {
protected:
    /// A program on PATH that notes its arguments, each behind a line "=", and then does what `script` says.
    void install(const std::string& name, const std::string& script)
    {
        const fs::path notes = directory.path() / "arguments";
        const fs::path program = directory.write(
            "bin/" + name, "#!/bin/sh\nfor each; do printf '=\\n%s\\n' \"$each\"; done > '" + notes.native()
                               + ".new' && mv '" + notes.native() + ".new' '" + notes.native() + "'\n" + script + "\n");
        fs::permissions(program, fs::perms::owner_all);
    }
    std::vector<std::string> arguments() const
    {
        std::vector<std::string> found;
        std::istringstream lines(PrivateDirectory::read(directory.path() / "arguments"));
        for (std::string line; std::getline(lines, line);)
            if (line == "=")
                found.emplace_back();
            else if (!found.empty())
                found.back() += (found.back().empty() ? "" : "\n") + line;
        return found;
    }

    void knowMailHandler(const std::string& list = "config/mimeapps.list",
                         const std::string& group = "Default Applications")
    {
        directory.write("data/applications/org.example.Mail.desktop", "[Desktop Entry]\nType=Application\n");
        directory.write(list, "[" + group + "]\nx-scheme-handler/mailto=gone.desktop;org.example.Mail.desktop;\n");
    }
    void installMailer(const std::string& script)
    {
        knowMailHandler();
        install("xdg-email", script);
    }

    void installMessages(const std::string& lines, const std::string& name = "org.example.Messages")
    {
        directory.write("data/applications/" + name + ".desktop",
                        "[Desktop Entry]\nType=Application\nName=Messages\nImplements=org.clipsa.MessageComposer1;\n"
                            + lines);
    }
};

TEST_F(Programs, MailTheMovieWhereThereIsNoPortal)
{
    items.emplace_back(base::Url::fromPath(attachment));
    installMailer("exit 0");
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMail));
    EXPECT_TRUE(perform(kActivityTypeMail).completed);
    const auto given = arguments();
    ASSERT_THAT(given, SizeIs(9));
    EXPECT_THAT(std::vector(given.begin(), given.begin() + 6),
                ElementsAre("--utf8", "--subject", "Tux Racer 2026-11-21", "--body",
                            "Look at this\nhttps://example.org/tux", "--attach"));
    EXPECT_EQ(PrivateDirectory::read(given[6]), movieBytes) << "it stays there";
    EXPECT_EQ(fs::path(given[6]).filename(), "Tux Racer 2026-11-21.mp4");
    EXPECT_EQ(PrivateDirectory::read(given[8]), "notes");
}

TEST_F(Programs, MailNothingWhereThePortalDoes)
{
    installMailer("exit 0");
    start("done", {"Email=4"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMail));
    EXPECT_TRUE(perform(kActivityTypeMail).completed);
    EXPECT_THAT(arguments(), IsEmpty());
    EXPECT_THAT(calls("ComposeEmail"), SizeIs(1));
}

TEST_F(Programs, MailOnlyWhereSomethingOpensMailAddresses)
{
    install("xdg-email", "exit 0");
    EXPECT_THAT(types(), IsEmpty());
    directory.write("config/mimeapps.list", "[Default Applications]\nx-scheme-handler/mailto=gone.desktop\n");
    EXPECT_THAT(types(), IsEmpty()) << "it was removed";
    directory.write("config/mimeapps.list", "this is no list\n[");
    EXPECT_THAT(types(), IsEmpty());
    for (const auto& [list, group] : {std::pair("config/mimeapps.list", "Default Applications"),
                                      std::pair("config/mimeapps.list", "Added Associations"),
                                      std::pair("data/applications/mimeapps.list", "Default Applications"),
                                      std::pair("data/applications/mimeinfo.cache", "MIME Cache")}) {
        knowMailHandler(list, group);
        EXPECT_THAT(types(), ElementsAre(kActivityTypeMail)) << list;
        fs::remove(directory.path() / list);
        EXPECT_THAT(types(), IsEmpty());
    }
}

TEST_F(Programs, MailOnlyWhereTheProgramIs)
{
    knowMailHandler();
    EXPECT_THAT(types(), IsEmpty());
    directory.write("bin/xdg-email", "not a program");
    EXPECT_THAT(types(), IsEmpty());
}

TEST_F(Programs, MayFailToMail)
{
    for (const char* script : {"exit 4", "exit 3", "kill -9 $$"}) {
        installMailer(script);
        expectFailure(perform(kActivityTypeMail), "SHARE_MAIL_REFUSED");
    }
    installMailer("exit 0");
    const auto activity = activityOf(kActivityTypeMail);
    fs::remove(directory.path() / "bin/xdg-email");
    begin(activity);
    ASSERT_TRUE(pump([&] { return end.has_value(); }));
    expectFailure(*end, "SHARE_MAIL_REFUSED");
}

TEST_F(Programs, AreNotWaitedForForEverToMail)
{
    ASSERT_EQ(::mkfifo((directory.path() / "started").c_str(), 0600), 0);
    installMailer("echo $$ > '" + (directory.path() / "started").native() + "'; exec tail -f /dev/null");
    begin(activityOf(kActivityTypeMail));
    machine.drain();
    const int process = std::stoi(PrivateDirectory::read(directory.path() / "started"));
    machine.advance(std::chrono::seconds(59));
    EXPECT_FALSE(end);
    machine.advance(std::chrono::seconds(1));
    ASSERT_TRUE(end);
    expectFailure(*end, "SHARE_MAIL_SILENT");
    EXPECT_EQ(::kill(process, 0), 0) << "it may be the user's mail program";
    ::kill(process, SIGKILL);
    EXPECT_TRUE(tests::waitForEnd(process, tests::Child::kDeadline));
}

TEST_F(Programs, EndWhenTheUserCancels)
{
    ASSERT_EQ(::mkfifo((directory.path() / "started").c_str(), 0600), 0);
    installMailer("echo $$ > '" + (directory.path() / "started").native() + "'; exec tail -f /dev/null");
    const auto activity = activityOf(kActivityTypeMail);
    begin(activity);
    machine.drain();
    const int process = std::stoi(PrivateDirectory::read(directory.path() / "started"));
    activity->cancel();
    ASSERT_TRUE(end);
    EXPECT_FALSE(end->completed);
    EXPECT_FALSE(end->error);
    EXPECT_TRUE(tests::waitForEnd(process, tests::Child::kDeadline));
}

TEST_F(Programs, MailWhatIsWildWithoutAShell)
{
    items = {"$(touch '" + (directory.path() / "hacked").native() + "'); `id` \"'\n--attach\n/etc/passwd"
                 + std::string(1'000'000, 'x'),
             base::Url::fromPath(movie)};
    installMailer("exit 0");
    EXPECT_TRUE(perform(kActivityTypeMail).completed);
    EXPECT_FALSE(fs::exists(directory.path() / "hacked"));
    ASSERT_THAT(arguments(), SizeIs(7));
    EXPECT_LE(arguments()[4].size(), portals::kLongestMailBody);
    EXPECT_THAT(arguments()[4], HasSubstr("`id` \"'\n--attach\n/etc/passwdxxx"));
}

TEST_F(Programs, SendMessagesWhenTheySayThatTheyTakeFiles)
{
    directory.write("data/applications/org.example.Calls.desktop",
                    "[Desktop Entry]\nType=Application\nName=Calls\nDBusActivatable=true\n"
                    "MimeType=x-scheme-handler/sms;\n");
    EXPECT_THAT(types(), IsEmpty());
    installMessages("DBusActivatable=true\n");
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMessage));
    EXPECT_EQ(activities[0]->activityTitle(), "Message");
}

TEST_F(Programs, SendMessagesByTheBus)
{
    items.emplace_back(base::Url::fromPath(attachment));
    installMessages("DBusActivatable=true\n");
    start("done", {"Messages=1"});
    EXPECT_TRUE(perform(kActivityTypeMessage).completed);
    EXPECT_EQ(receiver, "Messages");
    ASSERT_THAT(calls("Open"), SizeIs(1));
    EXPECT_EQ(calls("Open")[0]["path"].toString(), "/org/example/Messages");
    const QJsonArray given = calls("Open")[0]["arguments"].toArray();
    ASSERT_EQ(given[0].toArray().size(), 2);
    const auto file = base::Url::fromString(given[0].toArray()[0].toString().toStdString());
    ASSERT_TRUE(file);
    EXPECT_EQ(PrivateDirectory::read(file->path()), movieBytes);
    EXPECT_EQ(given[1].toObject()["org.clipsa.text"].toString(), "Look at this\nhttps://example.org/tux");
}

TEST_F(Programs, MayRefuseToSendMessages)
{
    installMessages("DBusActivatable=true\n");
    expectFailure(perform(kActivityTypeMessage), "SHARE_MESSAGE_REFUSED"); // it cannot be started
    start("error", {"Messages=1"});
    expectFailure(perform(kActivityTypeMessage), "SHARE_MESSAGE_REFUSED");
    start("silent", {"Messages=1"});
    begin(activityOf(kActivityTypeMessage));
    ASSERT_TRUE(pump([&] { return calls("Open").size() == 2; }));
    machine.advance(std::chrono::seconds(20));
    ASSERT_TRUE(end);
    expectFailure(*end, "SHARE_MESSAGE_REFUSED");
}

TEST_F(Programs, SendMessagesByTheirCommand)
{
    install("messages", "exit 0");
    installMessages("Exec=messages --to \"any body\" %i --file=%f %U %c %%\n");
    EXPECT_TRUE(perform(kActivityTypeMessage).completed);
    const auto given = arguments();
    ASSERT_THAT(given, SizeIs(6));
    EXPECT_EQ(given[1], "any body");
    EXPECT_EQ(PrivateDirectory::read(given[2].substr(std::string("--file=").size())), movieBytes);
    EXPECT_THAT(given[3],
                testing::AllOf(testing::StartsWith("file:///"), testing::EndsWith("/Tux%20Racer%202026-11-21.mp4")));
    EXPECT_EQ(given[4], "Messages");
    EXPECT_EQ(given[5], "%");
}

TEST_F(Programs, ThatRunOnHaveTakenTheMessage)
{
    ASSERT_EQ(::mkfifo((directory.path() / "started").c_str(), 0600), 0);
    install("messages", "echo $$ > '" + (directory.path() / "started").native() + "'; exec tail -f /dev/null");
    installMessages("Exec=messages %f\n");
    begin(activityOf(kActivityTypeMessage));
    machine.drain();
    const int process = std::stoi(PrivateDirectory::read(directory.path() / "started"));
    EXPECT_FALSE(end);
    machine.advance(std::chrono::seconds(3));
    ASSERT_TRUE(end);
    EXPECT_TRUE(end->completed);
    EXPECT_EQ(::kill(process, 0), 0);
    ::kill(process, SIGKILL);
    EXPECT_TRUE(tests::waitForEnd(process, tests::Child::kDeadline));
}

TEST_F(Programs, ThatFailHaveNotTakenTheMessage)
{
    install("messages", "exit 1");
    installMessages("Exec=messages %f\n");
    expectFailure(perform(kActivityTypeMessage), "SHARE_MESSAGE_REFUSED");
}

TEST_F(Programs, AreNamedWhereSeveralSendMessages)
{
    installMessages("DBusActivatable=true\n");
    installMessages("DBusActivatable=true\nName=Chat\n", "org.example.Chat");
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMessage, kActivityTypeMessage));
    EXPECT_EQ(activities[0]->activityTitle(), "Message with Chat");
    EXPECT_EQ(activities[1]->activityTitle(), "Message with Messages");
}

TEST_F(Programs, ThatLieInTheirEntriesAreNotOffered)
{
    install("messages", "exit 0");
    for (const char* lie : {"", "Exec=gone %f\n", "Exec=messages\n", "Exec=\"messages %f\n",
                            "Hidden=true\nExec=messages %f\n", "Terminal=true\nExec=messages %f\n",
                            "TryExec=gone\nExec=messages %f\n", "Type=Link\nExec=messages %f\n", "Exec=%f\n"}) {
        installMessages(lie);
        EXPECT_THAT(types(), IsEmpty()) << lie;
    }
    directory.write("data/applications/org.example.Messages.desktop", std::string(2'000'000, '\n'));
    EXPECT_THAT(types(), IsEmpty());
}

TEST_F(Programs, HaveNamesThatCanBeShown)
{
    install("messages", "exit 0");
    installMessages("Name=evil\u202Egpj.exe\nExec=messages %f\n");
    find();
    ASSERT_THAT(activities, SizeIs(1));
    EXPECT_TRUE(perform(kActivityTypeMessage).completed);
    EXPECT_EQ(receiver, "org.example.Messages");
}

TEST_F(Programs, AreHiddenByAnEntryOfTheUsers)
{
    applications.data = {(directory.path() / "mine").native(), (directory.path() / "data").native()};
    install("messages", "exit 0");
    installMessages("Exec=messages %f\n");
    EXPECT_THAT(types(), SizeIs(1));
    directory.write("mine/applications/org.example.Messages.desktop",
                    "[Desktop Entry]\nType=Application\nHidden=true\n");
    EXPECT_THAT(types(), IsEmpty());
}

TEST(MailTexts, HaveASubjectOfOneLine)
{
    using portals::mailSubject;
    EXPECT_EQ(mailSubject("Tux Racer"), "Tux Racer");
    EXPECT_EQ(mailSubject("a\nBcc: all@example.org\tb"), "a Bcc: all@example.org b");
    EXPECT_EQ(mailSubject("movie\u202E4pm"), "movie4pm");
    EXPECT_EQ(mailSubject("a\u200Cb\u200Dc"), "a\u200Cb\u200Dc") << "joiners belong to words and faces";
    const std::string cut = mailSubject(std::string(199, 'x') + "éé");
    EXPECT_EQ(cut, std::string(197, 'x') + "…");
    EXPECT_EQ(mailSubject(std::string(200, 'x')), std::string(200, 'x'));
}

TEST(MailTexts, KeepTheirLinesAndDirectionInTheBody)
{
    using portals::mailBody;
    EXPECT_EQ(mailBody("one\r\ntwo\tthree\x07"), "one\ntwo\tthree");
    EXPECT_EQ(mailBody("\u200Fשלום"), "\u200Fשלום");
    EXPECT_EQ(mailBody(""), "");
    std::string wide;
    for (int i = 0; i < 200'000; ++i)
        wide += "録";
    const std::string cut = mailBody(wide);
    EXPECT_LE(cut.size(), portals::kLongestMailBody);
    EXPECT_EQ(cut.size() % 3, 0U) << "no character is cut in two";
    EXPECT_THAT(cut, testing::EndsWith("録…"));
    EXPECT_THAT(mailBody(std::string(1'000'000, '\x07') + "x"), "…");
}

TEST(ApplicationsOfTheUser, AreWhereTheEnvironmentSays)
{
    const std::pair<const char*, const char*> kVariables[] = {{"XDG_DATA_HOME", "/data"},
                                                              {"XDG_DATA_DIRS", "/one:relative:/two"},
                                                              {"XDG_CONFIG_HOME", "not-a-path"},
                                                              {"XDG_CONFIG_DIRS", ""},
                                                              {"HOME", "/home/me"}};
    std::vector<std::pair<const char*, std::optional<std::string>>> before;
    for (const auto& [name, value] : kVariables) {
        const char* const old = ::getenv(name);
        before.emplace_back(name, old ? std::optional<std::string>(old) : std::nullopt);
        ::setenv(name, value, 1);
    }
    const auto found = portals::ApplicationDirectories::ofUser();
    for (const auto& [name, value] : before)
        if (value)
            ::setenv(name, value->c_str(), 1);
        else
            ::unsetenv(name);
    EXPECT_THAT(found.data, ElementsAre("/data", "/one", "/two"));
    EXPECT_THAT(found.configuration, ElementsAre("/home/me/.config", "/etc/xdg"));
}

} // namespace

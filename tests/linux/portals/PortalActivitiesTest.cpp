// What the portal is asked for each of them, and what comes of what it answers.

#include "linux/portals/Desktop.h"
#include "linux/portals/OpenUri.h"
#include "platform/sharing/ActivityTypes.h"

#include <csignal>
#include <sys/resource.h>

namespace {

using namespace platform;
using testing::EndsWith;
using testing::SizeIs;
using testing::StartsWith;
namespace fs = std::filesystem;
using tests::PrivateDirectory;

class ThePortal : public tests::Desktop {};

TEST_F(ThePortal, OpensAddresses)
{
    const auto portal = std::make_shared<portals::Portal>(machine.system, bus::Bus::session(),
                                                          [] { return std::string("wayland:handle"); });
    for (const auto& [behaviour, expected] : {std::pair("done", portals::PortalRequest::End::Done),
                                              std::pair("cancel", portals::PortalRequest::End::Cancelled),
                                              std::pair("fail", portals::PortalRequest::End::Refused)}) {
        start(behaviour);
        std::optional<portals::PortalRequest::End> how;
        const auto request =
            portals::openUri(portal, "https://example.org/?a=b",
                             [&](const portals::PortalRequest::Outcome& outcome) { how = outcome.end; });
        EXPECT_TRUE(pump([&] { return how.has_value(); }));
        EXPECT_EQ(how, expected);
    }
    const QJsonArray arguments = calls("OpenURI")[0]["arguments"].toArray();
    EXPECT_EQ(arguments[0].toString(), "wayland:handle");
    EXPECT_EQ(arguments[1].toString(), "https://example.org/?a=b");
}

TEST_F(ThePortal, ComposesAMailWithTheMovieAndWhatGoesAlong)
{
    items.emplace_back(base::Url::fromPath(attachment));
    start("done");
    const auto how = perform(kActivityTypeMail);
    EXPECT_TRUE(how.completed);
    EXPECT_FALSE(how.error);

    ASSERT_THAT(calls("ComposeEmail"), SizeIs(1));
    EXPECT_EQ(calls("ComposeEmail")[0]["arguments"].toArray()[0].toString(), "x11:2a") << "the window";
    const QJsonObject mail = options("ComposeEmail");
    EXPECT_EQ(mail["subject"].toString(), "Tux Racer 2026-11-21");
    EXPECT_EQ(mail["body"].toString(), "Look at this\nhttps://example.org/tux");
    EXPECT_FALSE(mail.contains("address"));
    const QJsonArray attached = mail["attachment_fds"].toArray();
    ASSERT_EQ(attached.size(), 2);
    EXPECT_EQ(bytes(attached[0]), movieBytes);
    EXPECT_EQ(bytes(attached[1]), "notes");
    for (const auto& each : attached)
        EXPECT_FALSE(each.toObject()["writable"].toBool());
}

TEST_F(ThePortal, ComposesAMailWithoutABodyWhereThereIsNoText)
{
    items = {"", base::Url::fromPath(movie)};
    start("done");
    EXPECT_TRUE(perform(kActivityTypeMail).completed);
    EXPECT_FALSE(options("ComposeEmail").contains("body"));
}

TEST_F(ThePortal, ComposesAMailWithATextThatIsFarTooLong)
{
    items = {std::string(1'000'000, 't') + std::string(1, '\0') + "\x1b[31m\xff", base::Url::fromPath(movie)};
    start("done");
    EXPECT_TRUE(perform(kActivityTypeMail).completed);
    const std::string body = options("ComposeEmail")["body"].toString().toStdString();
    EXPECT_LE(body.size(), 30'000U);
    EXPECT_THAT(body, EndsWith("t…"));
}

TEST_F(ThePortal, ComposesAMailWhoseTextIsWild)
{
    items = {std::string("a\0b\x1b[31m\r\n\u202Ec\xff", 14), base::Url::fromPath(movie)};
    start("done");
    EXPECT_TRUE(perform(kActivityTypeMail).completed);
    EXPECT_THAT(options("ComposeEmail")["body"].toString().toStdString(), StartsWith("a\uFFFDb[31m\n"));
}

TEST_F(ThePortal, OpensTheMovieWithWhatTheUserChooses)
{
    items.emplace_back(base::Url::fromPath(attachment));
    start("done");
    EXPECT_TRUE(perform(kActivityTypeOpenWith).completed);
    ASSERT_THAT(calls("OpenFile"), SizeIs(1));
    const QJsonArray arguments = calls("OpenFile")[0]["arguments"].toArray();
    EXPECT_EQ(bytes(arguments[1]), movieBytes);
    EXPECT_TRUE(options("OpenFile")["ask"].toBool());
}

TEST_F(ThePortal, GivesTheMovieToOthersFromTheOutbox)
{
    start("done");
    EXPECT_TRUE(perform(kActivityTypeOpenWith).completed);
    EXPECT_EQ(outboxSize(), 1U);
    std::string there;
    for (const auto& entry : fs::recursive_directory_iterator(directory.path() / "outbox"))
        if (entry.path().extension() == ".mp4")
            there = entry.path();
    EXPECT_THAT(there, EndsWith("/Tux Racer 2026-11-21.mp4"));
    std::ofstream(there) << "changed";
    EXPECT_EQ(PrivateDirectory::read(movie), movieBytes) << "whoever opens it may change it";
}

TEST_F(ThePortal, SavesACopyWhereTheUserWantsIt)
{
    start("done");
    fs::create_directory(directory.path() / "chosen");
    const auto how = perform(kActivityTypeSaveACopy);
    EXPECT_TRUE(how.completed);
    EXPECT_EQ(PrivateDirectory::read(directory.path() / "chosen/copy.mp4"), movieBytes);
    EXPECT_EQ(receiver, directory.path() / "chosen/copy.mp4");

    const QJsonObject asked = options("SaveFile");
    EXPECT_EQ(asked["current_name"].toString(), "Tux Racer 2026-11-21.mp4");
    EXPECT_EQ(asked["current_folder"].toString().toStdString(),
              (directory.path() / "Videos").native() + std::string(1, '\0'));
    EXPECT_EQ(calls("SaveFile")[0]["arguments"].toArray()[1].toString(), "Save a copy…") << "the title";
    EXPECT_EQ(outboxSize(), 0U);
}

TEST_F(ThePortal, SavesACopyInThePlaceOfWhatIsThere)
{
    start("done");
    directory.write("chosen/copy.mp4", std::string(5'000'000, 'o'));
    EXPECT_TRUE(perform(kActivityTypeSaveACopy).completed);
    EXPECT_EQ(PrivateDirectory::read(directory.path() / "chosen/copy.mp4"), movieBytes);
}

TEST_F(ThePortal, SavesACopyUnderANameWithAnyLetters)
{
    directory.write("choice", "file://" + directory.path().native() + "/chosen/%C3%9C%20%25%23%3F.mp4");
    fs::create_directory(directory.path() / "chosen");
    start("done");
    EXPECT_TRUE(perform(kActivityTypeSaveACopy).completed);
    EXPECT_EQ(PrivateDirectory::read(directory.path() / "chosen/Ü %#?.mp4"), movieBytes);
}

TEST_F(ThePortal, SavesACopyOfAMovieWhoseFileGoesMeanwhile)
{
    start("hold");
    begin(activityOf(kActivityTypeSaveACopy));
    ASSERT_TRUE(pump([&] { return calls("SaveFile").size() == 1; }));
    fs::remove(movie);
    fs::create_directory(directory.path() / "chosen");
    directory.write("go-on", "");
    ASSERT_TRUE(pump([&] { return end.has_value(); }));
    EXPECT_TRUE(end->completed);
    EXPECT_EQ(PrivateDirectory::read(directory.path() / "chosen/copy.mp4"), movieBytes);
}

TEST_F(ThePortal, SaysWhyACopyCannotBeSaved)
{
    start("done");
    expectFailure(perform(kActivityTypeSaveACopy), "SHARE_COPY_FAILED"); // there is no such directory
    for (const char* odd : {"", "https://example.org/a.mp4", "file:", "copy.mp4"}) {
        directory.write("choice", odd);
        expectFailure(perform(kActivityTypeSaveACopy), "SHARE_SAVE_A_COPY_REFUSED");
    }
    directory.write("choice", "file:///");
    expectFailure(perform(kActivityTypeSaveACopy), "SHARE_COPY_FAILED");
}

TEST_F(ThePortal, LeavesNothingOfACopyThatDoesNotFit)
{
    start("done");
    directory.write("chosen/copy.mp4", "what was there");
    rlimit before = {};
    ::getrlimit(RLIMIT_FSIZE, &before);
    const rlimit limit = {100'000, before.rlim_max};
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    const auto activity = activityOf(kActivityTypeSaveACopy);
    ::setrlimit(RLIMIT_FSIZE, &limit);
    begin(activity);
    EXPECT_TRUE(pump([&] { return end.has_value(); }));
    ::setrlimit(RLIMIT_FSIZE, &before);
    std::signal(SIGXFSZ, handler);
    expectFailure(*end, "SHARE_COPY_DISK_FULL");
    EXPECT_EQ(PrivateDirectory::read(directory.path() / "chosen/copy.mp4"), "what was there");
    const fs::directory_iterator left(directory.path() / "chosen");
    EXPECT_EQ(std::distance(fs::begin(left), fs::end(left)), 1);
}

TEST_F(ThePortal, ShowsTheUsersOwnFileInItsFolder)
{
    start("done");
    EXPECT_TRUE(perform(kActivityTypeShowInFolder).completed);
    ASSERT_THAT(calls("OpenDirectory"), SizeIs(1));
    EXPECT_EQ(bytes(calls("OpenDirectory")[0]["arguments"].toArray()[1]), movieBytes);
    EXPECT_EQ(outboxSize(), 0U);
}

TEST_F(ThePortal, ShowsAFileOfTheEditorsInTheOutbox)
{
    files.resolvedPrefix = (directory.path() / "mounted").native();
    directory.write("mounted" + movie, movieBytes);
    start("done");
    EXPECT_TRUE(perform(kActivityTypeShowInFolder).completed);
    EXPECT_EQ(bytes(calls("OpenDirectory")[0]["arguments"].toArray()[1]), movieBytes);
    EXPECT_EQ(outboxSize(), 1U);
}

TEST_F(ThePortal, IsNotNeededToShowAFolder)
{
    start("done", {"FileManager=1"});
    EXPECT_TRUE(perform(kActivityTypeShowInFolder).completed);
    const QJsonArray arguments = calls("ShowItems")[0]["arguments"].toArray();
    EXPECT_EQ(arguments[0].toArray()[0].toString().toStdString(), base::Url::fromPath(movie).string());
    start("error", {"FileManager=1"});
    expectFailure(perform(kActivityTypeShowInFolder), "SHARE_SHOW_IN_FOLDER_REFUSED");
    start("silent", {"FileManager=1"});
    begin(activityOf(kActivityTypeShowInFolder));
    ASSERT_TRUE(pump([&] { return calls("ShowItems").size() == 3; }));
    machine.advance(std::chrono::seconds(20));
    ASSERT_TRUE(end);
    expectFailure(*end, "SHARE_DESKTOP_SILENT");
}

} // namespace

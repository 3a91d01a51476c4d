// What is made of the portal's answers: early, late, wrong, from somebody else, or none.

#include "linux/portals/Desktop.h"
#include "platform/sharing/ActivityTypes.h"

namespace {

using namespace platform;
using testing::IsEmpty;
namespace fs = std::filesystem;

class ARequestOfThePortal : public tests::Desktop {};

TEST_F(ARequestOfThePortal, MayRespondBeforeItAnswersOrAtAPathOfItsOwn)
{
    for (const char* behaviour : {"first", "own-path"}) {
        start(behaviour);
        EXPECT_TRUE(perform(kActivityTypeMail).completed) << behaviour;
        EXPECT_TRUE(perform(kActivityTypeOpenWith).completed) << behaviour;
    }
}

TEST_F(ARequestOfThePortal, IsListenedToAtThePathThatItPromises)
{
    start("done");
    perform(kActivityTypeMail);
    const std::string path = calls("ComposeEmail")[0]["path"].toString().toStdString();
    EXPECT_THAT(path, testing::MatchesRegex("/org/freedesktop/portal/desktop/request/[0-9]+_[0-9]+/clipsa_[0-9a-f]+"));
}

TEST_F(ARequestOfThePortal, TellsThatTheUserHasCancelled)
{
    start("cancel");
    for (const char* type :
         {kActivityTypeMail, kActivityTypeOpenWith, kActivityTypeSaveACopy, kActivityTypeShowInFolder}) {
        const auto how = perform(type);
        EXPECT_FALSE(how.completed) << type;
        EXPECT_FALSE(how.error) << "the user knows: " << type;
    }
}

TEST_F(ARequestOfThePortal, MayRefuse)
{
    for (const char* behaviour : {"fail", "error", "odd-reply", "odd-response"}) {
        start(behaviour);
        expectFailure(perform(kActivityTypeMail), "SHARE_MAIL_REFUSED");
        expectFailure(perform(kActivityTypeOpenWith), "SHARE_OPEN_WITH_REFUSED");
        expectFailure(perform(kActivityTypeSaveACopy), "SHARE_SAVE_A_COPY_REFUSED");
        expectFailure(perform(kActivityTypeShowInFolder), "SHARE_SHOW_IN_FOLDER_REFUSED");
    }
}

TEST_F(ARequestOfThePortal, ThatTakesNoCallIsNotWaitedForForEver)
{
    start("silent");
    begin(activityOf(kActivityTypeMail));
    ASSERT_TRUE(pump([&] { return calls("ComposeEmail").size() == 1; }));
    machine.advance(std::chrono::milliseconds(19'999));
    EXPECT_FALSE(end);
    machine.advance(std::chrono::milliseconds(1));
    ASSERT_TRUE(end);
    expectFailure(*end, "SHARE_DESKTOP_SILENT");
    // What it opens all the same is closed again.
    directory.write("go-on", "");
    EXPECT_TRUE(pump([&] { return calls("Close").size() == 2; })) << "at once, and when there is something";
}

TEST_F(ARequestOfThePortal, IsWaitedForAsLongAsTheUserTakes)
{
    start("hold");
    const auto activity = activityOf(kActivityTypeMail);
    begin(activity);
    ASSERT_TRUE(pump([&] { return calls("ComposeEmail").size() == 1; }));
    find(); // what the portal says of this comes behind its answer to the call
    machine.advance(std::chrono::hours(3));
    EXPECT_FALSE(end);
    activity->cancel();
    EXPECT_TRUE(end);
}

TEST_F(ARequestOfThePortal, ClosesItsDialogueWhenTheUserCancels)
{
    start("hold");
    const auto activity = activityOf(kActivityTypeOpenWith);
    begin(activity);
    ASSERT_TRUE(pump([&] { return calls("OpenFile").size() == 1; }));
    find(); // its answer to the call is there
    activity->cancel();
    ASSERT_TRUE(end) << "at once";
    EXPECT_FALSE(end->completed);
    EXPECT_FALSE(end->error);
    ASSERT_TRUE(pump([&] { return !calls("Close").empty(); }));
    EXPECT_EQ(calls("Close")[0]["path"], calls("OpenFile")[0]["path"]);
}

TEST_F(ARequestOfThePortal, ClosesItsDialogueWhenItIsLetGoOf)
{
    start("hold");
    auto activity = activityOf(kActivityTypeOpenWith);
    begin(activity);
    ASSERT_TRUE(pump([&] { return calls("OpenFile").size() == 1; }));
    find();
    activity.reset();
    EXPECT_TRUE(pump([&] { return !calls("Close").empty(); }));
    EXPECT_FALSE(end) << "nobody is there to be told";
}

TEST_F(ARequestOfThePortal, ThatAnswersLateIsNotHeard)
{
    start("silent");
    const auto activity = activityOf(kActivityTypeMail);
    begin(activity);
    ASSERT_TRUE(pump([&] { return calls("ComposeEmail").size() == 1; }));
    activity->cancel();
    end.reset();
    directory.write("go-on", "");
    EXPECT_TRUE(pump([&] { return calls("Close").size() == 2; }));
    EXPECT_FALSE(end);
}

TEST_F(ARequestOfThePortal, MayVanishInTheMiddle)
{
    for (const char* behaviour : {"hold", "silent"}) {
        start(behaviour);
        const auto before = calls("ComposeEmail").size();
        begin(activityOf(kActivityTypeMail));
        ASSERT_TRUE(pump([&] { return calls("ComposeEmail").size() == before + 1; }));
        stop();
        ASSERT_TRUE(pump([&] { return end.has_value(); }));
        expectFailure(*end, "SHARE_DESKTOP_GONE");
    }
}

TEST_F(ARequestOfThePortal, MayBeGoneWhenItIsNeeded)
{
    start("done");
    const auto activity = activityOf(kActivityTypeMail);
    stop();
    begin(activity);
    ASSERT_TRUE(pump([&] { return end.has_value(); }));
    expectFailure(*end, "SHARE_DESKTOP_SILENT");
}

TEST_F(ARequestOfThePortal, IsNotAskedWhenTheMovieIsGone)
{
    start("done");
    const auto activity = activityOf(kActivityTypeMail);
    fs::remove(movie);
    begin(activity);
    ASSERT_TRUE(pump([&] { return end.has_value(); }));
    expectFailure(*end, "SHARE_FILE_GONE");
    EXPECT_THAT(calls("ComposeEmail"), IsEmpty());
}

TEST_F(ARequestOfThePortal, KeepsTheProcessAliveUntilItsEnd)
{
    start("hold");
    const auto activity = activityOf(kActivityTypeMail);
    begin(activity);
    EXPECT_FALSE(works.isEmpty());
    ASSERT_TRUE(pump([&] { return calls("ComposeEmail").size() == 1; }));
    EXPECT_FALSE(works.isEmpty());
    bool wasEmpty = true;
    activity->setEndHandler([&](const Activity::End&) { wasEmpty = works.isEmpty(); });
    activity->cancel();
    EXPECT_FALSE(wasEmpty) << "until it has been told";
    EXPECT_TRUE(works.isEmpty());
}

TEST_F(ARequestOfThePortal, TellsNothingOfHowLongTheUserTakes)
{
    start("done");
    EXPECT_TRUE(perform(kActivityTypeOpenWith).completed);
    ASSERT_FALSE(told.empty());
    EXPECT_FALSE(told.front());
    EXPECT_FALSE(told.back());
}

TEST_F(ARequestOfThePortal, IsNotTakenForSomebodyElseOnTheBus)
{
    start("hold");
    const auto activity = activityOf(kActivityTypeMail);
    begin(activity);
    ASSERT_TRUE(pump([&] { return !calls("ComposeEmail").empty(); }));
    auto liar = QDBusConnection::connectToBus(QDBusConnection::SessionBus, QStringLiteral("liar"));
    auto response = QDBusMessage::createTargetedSignal(
        QDBusConnection::sessionBus().baseService(), calls("ComposeEmail")[0]["path"].toString(),
        QStringLiteral("org.freedesktop.portal.Request"), QStringLiteral("Response"));
    response << 0U << QVariantMap();
    liar.send(response);
    liar.call(bus::questionToBus("GetId", {})); // the bus has passed it on
    find();
    EXPECT_FALSE(end);
    QDBusConnection::disconnectFromBus(QStringLiteral("liar"));
}

TEST_F(ARequestOfThePortal, CanBeAskedAgain)
{
    start("fail");
    const auto activity = activityOf(kActivityTypeMail);
    begin(activity);
    ASSERT_TRUE(pump([&] { return end.has_value(); }));
    expectFailure(*end, "SHARE_MAIL_REFUSED");
    activity->setEndHandler({});
    start("done");
    begin(activity);
    ASSERT_TRUE(pump([&] { return end.has_value(); }));
    EXPECT_TRUE(end->completed);
    EXPECT_EQ(options("ComposeEmail")["attachment_fds"].toArray().size(), 1);
}

TEST_F(ARequestOfThePortal, IsAskedAgainWhateverBecameOfWhatWasCancelled)
{
    start("hold");
    const auto activity = activityOf(kActivityTypeMail);
    const ShareItems now = std::exchange(items, {base::Url::fromPath(movie + ".gone")});
    begin(activity);
    activity->cancel();
    EXPECT_TRUE(end);
    activity->setEndHandler({});
    items = now;
    begin(activity);
    ASSERT_TRUE(pump([&] { return end || !calls("ComposeEmail").empty(); }));
    EXPECT_FALSE(end);
}

TEST_F(ARequestOfThePortal, MayLetGoOfTheActivityInItsEnd)
{
    start("done");
    auto activity = activityOf(kActivityTypeMail);
    activities.clear();
    bool isOver = false;
    activity->setEndHandler([&](const Activity::End&) {
        activity.reset();
        isOver = true;
    });
    activity->prepareWithActivityItems(items);
    activity->performActivity();
    EXPECT_TRUE(pump([&] { return isOver; }));
}

} // namespace

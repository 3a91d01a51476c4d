// What is offered: what is there, and nothing else, whatever the desktop is like.

#include "linux/portals/Desktop.h"
#include "platform/sharing/ActivityTypes.h"

#include <future>

namespace {

using namespace platform;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

class WhatTheDesktopOffers : public tests::Desktop {};

TEST_F(WhatTheDesktopOffers, IsNothingWithoutADesktop)
{
    EXPECT_THAT(types(), IsEmpty());
}

TEST_F(WhatTheDesktopOffers, IsNothingWithoutABus)
{
    settings.bus = [] {
        return QDBusConnection::connectToBus(QStringLiteral("unix:path=/nowhere"), QStringLiteral("none"));
    };
    provider = std::make_unique<portals::DesktopActivities>(environment, settings);
    EXPECT_THAT(types(), IsEmpty());
}

TEST_F(WhatTheDesktopOffers, IsNothingForTheBusThatLetsNobodyIn)
{
    std::promise<void> later;
    settings.bus = [open = later.get_future().share()] {
        open.wait();
        return QDBusConnection(QString());
    };
    provider = std::make_unique<portals::DesktopActivities>(environment, settings);
    bool isOver = false;
    provider->findActivities(items, [&](Activities more, bool isLast) {
        EXPECT_THAT(more, IsEmpty());
        isOver = isLast;
    });
    machine.drain();
    EXPECT_FALSE(isOver);
    machine.advance(portals::Portal::kVersionLimit);
    EXPECT_TRUE(isOver);
    later.set_value();
}

TEST_F(WhatTheDesktopOffers, IsAllThatAWholePortalHas)
{
    start("done");
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMail, kActivityTypeOpenWith, kActivityTypeSaveACopy,
                                     kActivityTypeShowInFolder));
    std::vector<std::string> titles;
    for (const auto& activity : activities)
        titles.push_back(activity->activityTitle());
    EXPECT_THAT(titles, ElementsAre("Mail", "Open with…", "Save a copy…", "Show in folder"));
}

TEST_F(WhatTheDesktopOffers, LeavesOutWhatAPortalDoesNotHave)
{
    start("done", {"OpenURI=4", "FileChooser=4"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeOpenWith, kActivityTypeSaveACopy, kActivityTypeShowInFolder));
    start("done", {"Email=4", "OpenURI=4"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMail, kActivityTypeOpenWith, kActivityTypeShowInFolder));
    start("done", {"Email=4", "FileChooser=4"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMail, kActivityTypeSaveACopy));
}

TEST_F(WhatTheDesktopOffers, LeavesOutWhatAnOldPortalCannotDo)
{
    start("done", {"OpenURI=1"});
    EXPECT_THAT(types(), IsEmpty());
    start("done", {"OpenURI=2"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeOpenWith));
    start("done", {"OpenURI=3"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeOpenWith, kActivityTypeShowInFolder));
}

TEST_F(WhatTheDesktopOffers, IsNothingOfAPortalThatDoesNotAnswer)
{
    start("mute");
    bool isOver = false;
    int count = 0;
    provider->findActivities(items, [&](const Activities& more, bool isLast) {
        count += static_cast<int>(more.size());
        isOver = isLast;
    });
    machine.drain();
    EXPECT_FALSE(isOver);
    machine.advance(std::chrono::milliseconds(1999));
    EXPECT_FALSE(isOver);
    machine.advance(std::chrono::milliseconds(1));
    EXPECT_TRUE(isOver);
    EXPECT_EQ(count, 0);
}

TEST_F(WhatTheDesktopOffers, IsAskedAnewEachTime)
{
    EXPECT_THAT(types(), IsEmpty());
    start("done", {"Email=4"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeMail));
    stop();
    EXPECT_THAT(types(), IsEmpty());
}

TEST_F(WhatTheDesktopOffers, IsToldBitByBit)
{
    start("mute");
    directory.write("data/applications/org.example.Messages.desktop",
                    "[Desktop Entry]\nType=Application\nName=Messages\nDBusActivatable=true\n"
                    "Implements=org.clipsa.MessageComposer1;\n");
    std::vector<std::string> found;
    bool isOver = false;
    provider->findActivities(items, [&](const Activities& more, bool isLast) {
        for (const auto& activity : more)
            found.push_back(activity->activityType());
        isOver = isLast;
    });
    EXPECT_TRUE(pump([&] { return !found.empty(); }));
    EXPECT_THAT(found, ElementsAre(kActivityTypeMessage));
    EXPECT_FALSE(isOver) << "the portal has not answered yet";
    machine.advance(portals::Portal::kVersionLimit);
    EXPECT_TRUE(pump([&] { return isOver; }));
    EXPECT_THAT(found, ElementsAre(kActivityTypeMessage));
}

TEST_F(WhatTheDesktopOffers, IsToldToNobodyOnceItsFinderHasGone)
{
    start("done");
    bool isTold = false;
    provider->findActivities(items, [&](const Activities&, bool) { isTold = true; });
    machine.drain();
    provider.reset();
    machine.advance(portals::Portal::kVersionLimit);
    // What the portal says meanwhile comes before what another one is told.
    provider = std::make_unique<portals::DesktopActivities>(environment, settings);
    find();
    EXPECT_FALSE(isTold);
}

TEST_F(WhatTheDesktopOffers, IsFoundForTwoAtOnce)
{
    start("done");
    int over = 0;
    for (int i = 0; i < 2; ++i)
        provider->findActivities(items, [&](const Activities&, bool isLast) { over += isLast ? 1 : 0; });
    EXPECT_TRUE(pump([&] { return over == 2; }));
}

TEST_F(WhatTheDesktopOffers, NeedsAFile)
{
    start("done");
    items = {"only a text"};
    EXPECT_THAT(types(), IsEmpty());
}

TEST_F(WhatTheDesktopOffers, ShowsFoldersByTheFileManagerWhereThePortalCannot)
{
    start("done", {"FileManager=1"});
    EXPECT_THAT(types(), ElementsAre(kActivityTypeShowInFolder));
    start("done", {"OpenURI=2", "FileManager=1"});
    EXPECT_THAT(types(), UnorderedElementsAre(kActivityTypeOpenWith, kActivityTypeShowInFolder));
    start("done", {"OpenURI=3", "FileManager=1"});
    EXPECT_THAT(types(), UnorderedElementsAre(kActivityTypeOpenWith, kActivityTypeShowInFolder)) << "once";
}

} // namespace

// The share sheet: what it shows and offers, in which order, and how it is steered.
#include "SharingFixture.h"

namespace tests {

namespace {

using platform::Key;
using testing::ElementsAre;

TEST_F(Sharing, ItOffersWhatCanBePerformedInTheOrderWanted)
{
    const auto own = activity("own");
    const auto impossible = activity("mail");
    impossible->canPerform = false;
    make({own}).setActivityTypeOrder({"mail", "message", "copy"});
    sheet->setExcludedActivityTypes({"copy"});
    begin();
    EXPECT_EQ(provider.asked.size(), 1U);
    provider.found({activity("folder"), activity("message"), impossible}, false);
    provider.found({activity("copy"), activity("mail")}, true);
    EXPECT_THAT(titles(), ElementsAre("mail", "message", "own", "folder"));
}

TEST_F(Sharing, WhatTheApplicationBringsIsThereAtOnceAndChosenLikeTheRest)
{
    make({activity("b"), activity("c"), activity("a")}).setActivityTypeOrder({"a", "b"});
    sheet->setExcludedActivityTypes({"c"});
    begin();
    EXPECT_THAT(titles(), ElementsAre("a", "b"));
}

TEST_F(Sharing, ItSaysWhatItIsAndHowItIsClosed)
{
    open({activity("mail")});
    EXPECT_EQ(sheet->title(), "Share");
    EXPECT_EQ(sheet->closeButton()->glyph(), "close");
    EXPECT_EQ(sheet->closeButton()->accessibility().name, "Close");
}

TEST_F(Sharing, ARowShowsWhatItsActivityIs)
{
    const auto mail = activity("mail");
    mail->image = std::make_shared<platform::Image>(platform::Bitmap::transparent(28, 28), 1);
    open({mail});
    const platform::ActivityRow& it = *row(0);
    EXPECT_EQ(it.row()->title(), "mail");
    EXPECT_EQ(it.row()->glyph(), "share");
    EXPECT_EQ(it.row()->image(platform::Button::State::Normal), mail->image);
    EXPECT_EQ(it.progressView()->accessibility().name, "mail");
    EXPECT_TRUE(it.progressView()->isHidden());
    EXPECT_TRUE(it.cancelButton()->isHidden());
    EXPECT_EQ(it.subviews().front(), it.row()) << "the bar stands on it";
}

TEST_F(Sharing, WhatComesLateGoesToTheEndAndMovesNothing)
{
    make().setActivityTypeOrder({"mail", "message"});
    begin();
    provider.found({activity("folder"), activity("message")}, false);
    EXPECT_THAT(titles(), ElementsAre("message", "folder"));
    settle();
    std::vector<base::Rect> before;
    for (const auto& each : sheet->list()->rows())
        before.push_back({each->convertToRoot({}), each->bounds().size});
    std::vector<std::shared_ptr<platform::Activity>> many;
    for (int i = 0; i < 10; ++i)
        many.push_back(activity("mail"));
    provider.found(many, true);
    settle();
    EXPECT_THAT(titles().front(), "message");
    for (std::size_t i = 0; i < before.size(); ++i)
        EXPECT_EQ((base::Rect{row(i)->convertToRoot({}), row(i)->bounds().size}), before[i]);
}

TEST_F(Sharing, ItGrowsOnItsWayUpAndIsCompleteWhenItHasGrown)
{
    make();
    bool complete = false;
    root->present(sheet, true, [&] { complete = true; });
    window->commit();
    const auto height = [this] { return window->topPresentation()->surface()->frame().height(); };
    const double before = height();
    machine.advance(std::chrono::milliseconds(200));
    std::vector<std::shared_ptr<platform::Activity>> many;
    for (int i = 0; i < 9; ++i)
        many.push_back(activity("device"));
    provider.found(many, false);
    tapRow(0);
    EXPECT_FALSE(sheet->isPerforming()) << "what moves is not pressed";
    window->commit();
    EXPECT_GT(height(), before);
    machine.advance(std::chrono::milliseconds(149));
    EXPECT_FALSE(complete);
    machine.advance(std::chrono::milliseconds(1));
    EXPECT_TRUE(complete);
    const double grown = height();
    provider.found(many, true);
    settle();
    EXPECT_EQ(height(), grown);
}

TEST_F(Sharing, ADragInTheListScrollsItAndClosesOnlyFromItsTop)
{
    std::vector<std::shared_ptr<platform::Activity>> many;
    for (int i = 0; i < 20; ++i)
        many.push_back(activity("device"));
    open(many);
    const auto& scroll = *sheet->list()->scrollView();
    const double y = scroll.convertToRoot({0, 0}).y;
    const auto drag = [&](double from, double to) {
        base::Instant now = machine.clock.now();
        window->touchDown({1, {200, from}, now});
        for (int i = 1; i <= 8; ++i)
            window->touchMove({1, {200, from + (to - from) * i / 8}, now += std::chrono::milliseconds(100)});
        window->touchUp({1, {200, to}, now + std::chrono::seconds(1)});
        window->commit();
        settle();
    };
    drag(y + 200, y + 100);
    EXPECT_GT(scroll.contentOffset(), 0);
    drag(y + 50, y + 300);
    EXPECT_EQ(scroll.contentOffset(), 0);
    EXPECT_FALSE(isGone());
    drag(y + 10, y + 500);
    EXPECT_TRUE(isGone());
}

TEST_F(Sharing, ItSaysThatItIsLookingUntilTheLastHasCome)
{
    make();
    begin();
    settle();
    EXPECT_EQ(sheet->list()->footerLabel()->text(), "Looking for more…");
    EXPECT_FALSE(sheet->list()->footerLabel()->isHidden());
    provider.found({activity("mail")}, false);
    EXPECT_FALSE(sheet->list()->footerLabel()->isHidden());
    provider.found({}, true);
    EXPECT_TRUE(sheet->list()->footerLabel()->isHidden());
}

TEST_F(Sharing, ItSaysWhenThereIsNothing)
{
    open({});
    EXPECT_EQ(sheet->list()->footerLabel()->text(), "Nothing on this device can take this recording.");
    EXPECT_FALSE(sheet->list()->footerLabel()->isHidden());
}

TEST_F(Sharing, ItShowsTheMovieWithoutWaitingForIt)
{
    items = {"A race", base::Url::fromPath("/tmp/race.mp4"), base::Url::fromPath("/tmp/no\u202Etes.txt")};
    make();
    begin();
    const auto& summary = *sheet->summary();
    EXPECT_EQ(summary.nameLabel()->text(), "race.mp4");
    EXPECT_EQ(summary.textLabel()->text(), "A race");
    EXPECT_EQ(summary.filesLabel()->text(), "With \u2068notes.txt\u2069");
    EXPECT_TRUE(summary.detailsLabel()->isHidden());
    EXPECT_THAT(files.calls, testing::IsEmpty()) << "a look at a file can take its time";
    const double height = summary.frame().height();
    machine.mainQueue.drain();
    machine.defaultQueue.drain();
    EXPECT_EQ(summary.detailsLabel()->text(), "0:42") << "what a worker has found is shown on the main queue";
    settle();
    EXPECT_FALSE(summary.detailsLabel()->isHidden());
    EXPECT_EQ(summary.detailsLabel()->text(), "0:42 · 12400000 bytes");
    EXPECT_EQ(summary.detailsLabel()->accessibility().name, "42 s, 12400000 bytes");
    ASSERT_EQ(media.imageGenerator()->requests.size(), 1U);
    EXPECT_EQ(media.imageGenerator()->requests[0].time, base::MediaTime::zero());
    EXPECT_EQ(media.imageGenerator()->maximumSize(), (base::Size{288, 288})) << "sharp on every screen, and no more";
    media.imageGenerator()->succeed(0, std::make_shared<platform::Image>(platform::Bitmap::transparent(160, 288), 1));
    EXPECT_FALSE(summary.picture());
    machine.drain();
    ASSERT_TRUE(summary.picture());
    EXPECT_EQ(summary.picture()->frame(), base::Rect::make(0, (72 - 129.6) / 2, 72, 129.6)) << "it fills its square";
    window->commit();
    EXPECT_EQ(summary.frame().height(), height);
}

TEST_F(Sharing, NothingAtItsTopStandsOnAnythingElse)
{
    items = {"A race", base::Url::fromPath("/tmp/a race with a name that is rather long.mp4"),
             base::Url::fromPath("/tmp/some notes that were written while it was raced.txt"),
             base::Url::fromPath("/tmp/b.txt")};
    open({});
    const auto& summary = *sheet->summary();
    EXPECT_LE(summary.nameLabel()->frame().maxX(), sheet->closeButton()->frame().minX());
    EXPECT_LE(summary.nameLabel()->frame().maxY(), summary.detailsLabel()->frame().minY());
    EXPECT_LE(summary.detailsLabel()->frame().maxY(), summary.filesLabel()->frame().minY());
    EXPECT_LE(summary.filesLabel()->frame().maxY(), summary.textLabel()->frame().minY());
    EXPECT_LE(summary.textLabel()->frame().maxY(), summary.frame().height());
}

TEST_F(Sharing, WhatIsNotKnownOfTheMovieIsNotSaid)
{
    media.movies["/tmp/race.mp4"] = FakeMovie::failing();
    open({});
    EXPECT_EQ(sheet->summary()->detailsLabel()->text(), "12400000 bytes");
    media.imageGenerator()->fail(0);
    machine.drain();
    EXPECT_FALSE(sheet->summary()->picture());
}

TEST_F(Sharing, WithoutItsSizeTheMoviesLengthIsSaid)
{
    files.fail(FileOperation::Attributes, "/tmp/race.mp4", EACCES);
    open({});
    EXPECT_EQ(sheet->summary()->detailsLabel()->text(), "0:42");
    EXPECT_EQ(sheet->summary()->detailsLabel()->accessibility().name, "42 s");
    EXPECT_FALSE(sheet->summary()->detailsLabel()->isHidden());
}

TEST_F(Sharing, OfManyFilesTheFirstAreNamed)
{
    for (const char* name : {"1", "2", "3", "4", "5", "6", "7"})
        items.emplace_back(base::Url::fromPath(std::string("/tmp/") + name));
    open({});
    const std::string& along = sheet->summary()->filesLabel()->text();
    EXPECT_THAT(along, testing::HasSubstr("5"));
    EXPECT_THAT(along, testing::Not(testing::HasSubstr("6")));
}

TEST_F(Sharing, NobodyWhoLooksAtTheMovieKeepsTheSheet)
{
    make();
    begin();
    const auto generator = media.imageGenerator();
    const auto asset = media.asset();
    machine.defaultQueue.drain();
    generator->succeed(0, std::make_shared<platform::Image>(platform::Bitmap::transparent(10, 10), 1));
    const std::weak_ptr<platform::ShareSheet> weak = sheet;
    const std::weak_ptr<platform::View> weakSummary = sheet->summary();
    dropEverything();
    EXPECT_TRUE(weak.expired());
    EXPECT_TRUE(weakSummary.expired());
    machine.drain();
}

TEST_F(Sharing, AWorkerThatHasNotLookedYetKeepsNothing)
{
    make();
    begin();
    const std::weak_ptr<platform::View> weakSummary = sheet->summary();
    dropEverything();
    EXPECT_TRUE(weakSummary.expired()) << "it would end on the worker";
    machine.drain();
}

TEST_F(Sharing, APictureThatComesAfterTheSheetHasGoneIsNobodys)
{
    open({});
    const auto generator = media.imageGenerator();
    root->dismiss(false);
    settle();
    sheet.reset();
    generator->succeed(0, std::make_shared<platform::Image>(platform::Bitmap::transparent(10, 10), 1));
    machine.drain();
}

TEST_F(Sharing, ATextOfAMegabyteTakesThreeLines)
{
    items[0] = std::string(1'000'000, 'w');
    open({activity("mail")});
    EXPECT_LT(sheet->summary()->textLabel()->text().size(), 1000U);
    EXPECT_LE(sheet->summary()->textLabel()->frame().height(), 60);
}

TEST_F(Sharing, KeysGoThroughTheRowsAndPick)
{
    const auto mail = activity("mail");
    const auto folder = activity("folder");
    open({mail, folder});
    window->keyDown(Key::Down);
    EXPECT_EQ(window->focusedView(), row(0)->row()) << "first to what it is for";
    window->moveFocus(false);
    EXPECT_EQ(window->focusedView(), sheet->closeButton());
    window->keyDown(Key::Down);
    EXPECT_EQ(window->focusedView(), row(0)->row());
    window->moveFocus(true);
    EXPECT_EQ(window->focusedView(), row(1)->row());
    window->keyDown(Key::Up);
    EXPECT_TRUE(window->keyDown(Key::Return));
    EXPECT_EQ(mail->performed, 1);
    EXPECT_EQ(window->focusedView(), row(0)->cancelButton()) << "who steers by keys can cancel by them";
    EXPECT_TRUE(window->keyDown(Key::Return));
    EXPECT_EQ(mail->cancelled, 1);
    EXPECT_EQ(window->focusedView(), row(0)->row());
}

TEST_F(Sharing, WithoutRowsKeysGoToTheCloseButton)
{
    open({});
    window->keyDown(Key::Down);
    EXPECT_EQ(window->focusedView(), sheet->closeButton());
}

TEST_F(Sharing, ItIsMirroredWhereWordsRunFromRightToLeft)
{
    window->setRightToLeft(true);
    open({activity("mail")});
    EXPECT_LT(sheet->closeButton()->frame().minX(), 10);
    EXPECT_GT(sheet->summary()->nameLabel()->frame().minX(), 40);
    EXPECT_EQ(sheet->summary()->nameLabel()->frame().maxX(), 400 - 16 - 72 - 12);
    tapRow(0);
    window->commit();
    EXPECT_LT(row(0)->cancelButton()->frame().minX(), 10);
}

TEST_F(Sharing, OnALowScreenTheListIsScrolled)
{
    std::vector<std::shared_ptr<platform::Activity>> many;
    for (int i = 0; i < 12; ++i)
        many.push_back(activity("device"));
    open(many);
    window->transitionToSize({720, 360});
    settle();
    const auto& scroll = *sheet->list()->scrollView();
    EXPECT_GT(scroll.maximumOffset(), 0);
    EXPECT_LE(scroll.convertToRoot({0, scroll.bounds().height()}).y, 360);
    for (int i = 0; i < 13; ++i)
        window->moveFocus(true);
    window->commit();
    EXPECT_EQ(window->focusedView(), row(11)->row());
    EXPECT_EQ(scroll.contentOffset(), scroll.maximumOffset());
}

TEST_F(Sharing, AnAnswerAfterTheSheetHasGoneChangesNothing)
{
    make();
    begin();
    settle();
    root->dismiss(true);
    settle();
    const auto found = provider.found;
    found({activity("mail")}, false);
    const std::weak_ptr<platform::ShareSheet> weak = sheet;
    sheet.reset();
    EXPECT_TRUE(weak.expired()) << "whoever still looks does not keep it";
    found({activity("mail")}, true);
    EXPECT_THAT(results, ElementsAre(" no"));
}

} // namespace

} // namespace tests

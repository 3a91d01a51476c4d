// A window on a real screen is looked at, tapped, dragged, turned and closed.
#include "end_to_end/RealWindow.h"

#include <sys/stat.h>
#include <vector>

using namespace tests;
using testing::SizeIs;

TEST_F(RealWindow, LooksAsInTheManualUprightAndOnItsSide)
{
    const auto movie = m_machine.movieFrom(tests::movie("pictures/phone.mp4"));
    const timespec recorded{1715682240, 0}; // as tools/make-pictures has it: 2024-05-14 10:24 UTC
    const timespec times[2] = {recorded, recorded};
    ::utimensat(AT_FDCWD, movie.c_str(), times, 0);
    ASSERT_NO_FATAL_FAILURE(start(movie, {"--app-name", "Weekend trip"}));
    for (const char* name : {"phone@1x.png", "phone-landscape@1x.png", "phone@1x.png"}) {
        const Screenshot wanted(fs::path(sourceFile("docs/pictures")) / name);
        ASSERT_FALSE(wanted.isNull());
        m_screen.resize(wanted.width(), wanted.height());
        double difference = 0;
        EXPECT_TRUE(m_screen.waitFor([&](const Screenshot& now) {
            difference = now.image().size() == wanted.image().size() ? differenceOf(now.image(), wanted.image()) : 255;
            return difference < kLargestDifference;
        })) << name
            << " differs by " << difference;
    }
    close();
}

TEST_P(RealWindowOfScale, HasItsBarsAtTheEdgesAndTheStripOnTheBottomBar)
{
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    const Screenshot picture = m_screen.picture();
    for (const double x : {4.0, kShort - 4.0}) {
        EXPECT_TRUE(isLight(at(picture, x, kTopBar - 2)));
        EXPECT_TRUE(isBlack(at(picture, x, kTopBar + 2)));
        EXPECT_TRUE(isBlack(at(picture, x, kStripMiddle - kStrip / 2 - 2)));
        EXPECT_FALSE(isBlack(at(picture, x, kStripMiddle - kStrip / 2 + 2)));
        EXPECT_FALSE(isLight(at(picture, x, kLong - kBottomBar - 2)));
        EXPECT_TRUE(isLight(at(picture, x, kLong - kBottomBar + 2)));
        EXPECT_TRUE(isLight(at(picture, x, kLong - 2)));
    }
    close();
}

TEST_F(RealWindow, ATapTakesTheBarsAwayAndAnotherBringsThemBack)
{
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    const Screenshot before = m_screen.picture();
    m_screen.tap(60, 150);
    ASSERT_NO_FATAL_FAILURE(waitForNoChrome());
    EXPECT_EQ(number(m_screen.picture()), 0);
    EXPECT_TRUE(isLight(at(m_screen.picture(), kShort / 2.0, kAboveLargeGlyph))) << "the large button stays";
    m_screen.tap(60, 150);
    ASSERT_NO_FATAL_FAILURE(waitForChrome());
    ASSERT_NO_FATAL_FAILURE(waitFor("picture as before", [&](const Screenshot& picture) {
        return differenceOf(withoutStrip(picture), withoutStrip(before)) < kUnseen;
    }));
    close();
}

TEST_F(RealWindow, PlaysToTheEndInOrderAndGoesBackToTheStartWithItsBars)
{
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    EXPECT_TRUE(isLight(at(m_screen.picture(), kShort / 2.0, kAboveLargeGlyph)));
    const auto before = Clock::now();
    m_screen.tap(kShort / 2.0, kLong / 2.0);
    ASSERT_NO_FATAL_FAILURE(waitForNoChrome());
    std::vector<int> numbers;
    ASSERT_NO_FATAL_FAILURE(waitFor("end", [&](const Screenshot& picture) {
        if (number(picture) == 0 && !numbers.empty())
            return isChromeShown(picture);
        if (number(picture) > 0 && (numbers.empty() || number(picture) != numbers.back()))
            numbers.push_back(number(picture));
        return false;
    }));
    EXPECT_GE(Clock::now() - before, std::chrono::seconds(4)) << "faster than time";
    EXPECT_TRUE(std::is_sorted(numbers.begin(), numbers.end())) << testing::PrintToString(numbers);
    EXPECT_GE(numbers.size(), 10U) << testing::PrintToString(numbers); // 120 when nothing else is to do
    EXPECT_GE(numbers.back(), kClock.count / 2);
    EXPECT_LT(numbers.back(), kClock.count);
    EXPECT_TRUE(showsPlay(m_screen.picture()));
    EXPECT_FALSE(isLight(at(m_screen.picture(), kShort / 2.0, kAboveLargeGlyph)))
        << "the large button has gone for good";
    close();
}

TEST_P(RealWindowOfScale, ShowsThePictureUnderTheFingerThatDragsAlongTheStrip)
{
    for (const Movie& movie : {kClock, kOneKeyframe}) {
        SCOPED_TRACE(movie.name);
        ASSERT_NO_FATAL_FAILURE(open(movie));
        m_screen.tap(kShort / 2.0, kLong / 2.0);
        ASSERT_NO_FATAL_FAILURE(waitForNoChrome());
        ASSERT_NO_FATAL_FAILURE(waitForPlayingPast(2));
        m_screen.tap(60, 150);
        ASSERT_NO_FATAL_FAILURE(waitFor(
            "pause button", [&](const Screenshot& picture) { return isChromeShown(picture) && showsPause(picture); }));

        m_screen.moveTo(180, kStripMiddle);
        m_screen.press();
        for (const double x : {180, 181, 190, 220, 260, 300, 340, 330, 260, 200, 140, 100, 60}) {
            SCOPED_TRACE(x);
            m_screen.moveTo(x, kStripMiddle);
            ASSERT_NO_FATAL_FAILURE(waitForNumber(numberUnder(x, movie), 1));
            ASSERT_NO_FATAL_FAILURE(waitFor("play head under the finger", [&](const Screenshot& picture) {
                return isBlue(at(picture, x, kStripMiddle));
            }));
        }
        ASSERT_NO_FATAL_FAILURE(waitFor("play button", [&](const Screenshot& picture) { return showsPlay(picture); }));
        m_screen.release();
        // Far above the strip, and only the pointer: nothing follows it any longer.
        m_screen.moveTo(300, 300);
        const int resting = number(m_screen.picture());
        EXPECT_NEAR(resting, numberUnder(60, movie), 1);
        m_screen.key(XKey::Period);
        ASSERT_NO_FATAL_FAILURE(waitForNumber(resting + 1));
        close();
    }
}

TEST_F(RealWindow, IsSteeredByKeys)
{
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    m_screen.key(XKey::Space);
    ASSERT_NO_FATAL_FAILURE(waitForNoChrome());
    ASSERT_NO_FATAL_FAILURE(waitForPlayingPast(5));
    m_screen.key(XKey::Space);
    m_screen.tap(60, 150);
    ASSERT_NO_FATAL_FAILURE(waitFor(
        "play button", [&](const Screenshot& picture) { return isChromeShown(picture) && showsPlay(picture); }));
    const int last = kClock.count - 1;
    const std::vector<std::pair<XKey, int>> steps = {
        {XKey::End, last}, {XKey::Comma, last - 1}, {XKey::Comma, last - 2}, {XKey::Period, last - 1},
        {XKey::Home, 0},   {XKey::Period, 1},       {XKey::Comma, 0},        {XKey::Comma, 0},
        {XKey::Right, 30}, {XKey::Right, 60},       {XKey::Left, 30},        {XKey::Home, 0}};
    for (const auto& [key, number] : steps) {
        m_screen.key(key);
        ASSERT_NO_FATAL_FAILURE(waitForNumber(number));
    }
    m_screen.keys({XKey::Control, XKey::Z}); // nothing to undo
    m_screen.key(XKey::Right);
    ASSERT_NO_FATAL_FAILURE(waitForNumber(30));
    EXPECT_TRUE(isChromeShown(m_screen.picture()));
    close();
}

TEST_P(RealWindowOfScale, KeepsItsPictureWhenItIsTurnedAndTheStripGoesToTheEdge)
{
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    m_screen.tap(250, kStripMiddle);
    const int wanted = numberUnder(250, kClock);
    ASSERT_NO_FATAL_FAILURE(waitForNumber(wanted, 1));
    const int shown = number(m_screen.picture());

    m_screen.resize(kLong, kShort);
    const double edge = kShort - kStrip;
    ASSERT_NO_FATAL_FAILURE(waitFor("one bar and the strip at the edge", [&](const Screenshot& picture) {
        if (!isOnItsSide(picture))
            return false;
        for (const double x : {4.0, kLong - 4.0}) // beside the movie
            if (!isLight(at(picture, x, kTopBar - 2)) || !isBlack(at(picture, x, kTopBar + 2))
                || !isBlack(at(picture, x, edge - 2)) || isBlack(at(picture, x, edge + 2))
                || isBlack(at(picture, x, kShort - 2)) || isLight(at(picture, x, kShort - 2)))
                return false;
        return true;
    }));
    m_screen.tap(kLong / 4.0, kShort / 2.0);
    ASSERT_NO_FATAL_FAILURE(waitFor("the same picture", [&](const Screenshot& picture) {
        return isOnItsSide(picture) && number(picture) == shown && isBlack(at(picture, 4, 4))
               && isBlack(at(picture, 4, kShort - 4));
    }));

    m_screen.resize(kShort, kLong);
    ASSERT_NO_FATAL_FAILURE(waitForNoChrome());
    ASSERT_NO_FATAL_FAILURE(waitForNumber(shown));
    m_screen.tap(60, 150);
    ASSERT_NO_FATAL_FAILURE(waitForChrome());
    EXPECT_EQ(number(m_screen.picture()), shown);
    close();
}

TEST_F(RealWindow, PlaysOnWhileItIsTurned)
{
    ASSERT_NO_FATAL_FAILURE(open(kOneKeyframe));
    m_screen.key(XKey::Space);
    ASSERT_NO_FATAL_FAILURE(waitForNoChrome());
    int last = 0;
    for (int i = 0; i < 3; ++i) {
        m_screen.resize(kLong, kShort);
        ASSERT_NO_FATAL_FAILURE(waitFor("later picture on its side", [&](const Screenshot& picture) {
            return isOnItsSide(picture) && number(picture) > last;
        }));
        last = number(m_screen.picture());
        m_screen.resize(kShort, kLong);
        ASSERT_NO_FATAL_FAILURE(waitFor("later picture upright", [&](const Screenshot& picture) {
            return isUpright(picture) && number(picture) > last && isChromeHidden(picture);
        }));
        last = number(m_screen.picture());
    }
    close();
}

TEST_F(RealWindow, PlaysOnWhenTheMovieIsRemovedMeanwhile)
{
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    m_screen.key(XKey::Space);
    ASSERT_NO_FATAL_FAILURE(waitForPlayingPast(3));
    ASSERT_THAT(m_machine.editorDirectories(), SizeIs(1));
    int removed = 0;
    for (const auto& entry : fs::recursive_directory_iterator(m_machine.editorDirectories().front()))
        if (entry.is_regular_file() && entry.file_size() > 10000)
            removed += fs::remove(entry.path()) ? 1 : 0;
    EXPECT_EQ(removed, 1);
    fs::remove(m_machine.movie(kClock.name));
    ASSERT_NO_FATAL_FAILURE(waitForPlayingPast(60));
    ASSERT_NO_FATAL_FAILURE(waitForChrome());
    ASSERT_NO_FATAL_FAILURE(waitForNumber(0));
    close();
}

TEST_F(RealWindow, IsClosedByTheWindowManagerAsByItsButton)
{
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    m_screen.closeWindow();
    EXPECT_TRUE(m_screen.waitForNoWindow());
    expectClosed();
    ASSERT_NO_FATAL_FAILURE(open(kClock));
    m_screen.tap(40, 38); // Cancel
    EXPECT_TRUE(m_screen.waitForNoWindow());
    expectClosed();
}

INSTANTIATE_TEST_SUITE_P(EndToEnd, RealWindowOfScale, testing::Values(1, 2), testing::PrintToStringParamName());

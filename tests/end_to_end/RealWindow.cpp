// A window on a real screen: the editor's own process on an X server, steered by a pointer and keys whose events come
// through the server, and judged by what the screen shows. The movie's picture says which one it is.
#include "end_to_end/Machine.h"
#include "end_to_end/Screen.h"

#include <QPainter>

#include <gmock/gmock.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <sys/stat.h>
#include <vector>

using namespace tests;
using testing::IsEmpty;
using testing::SizeIs;

namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

// A phone with a home button; points.
constexpr int kShort = 390;
constexpr int kLong = 760;
constexpr double kTopBar = 60;
constexpr double kBottomBar = 44;
constexpr double kStrip = 38;
constexpr double kStripInset = 10 + 16; // to the pictures, behind a grip
constexpr double kBarMiddle = kLong - kBottomBar / 2;
constexpr double kStripMiddle = kLong - kBottomBar - kStrip / 2;

// As of the tests of docs/pictures.
constexpr double kLargestDifference = 7;
constexpr double kUnseen = 2; // of 255

/// A movie whose picture says its number.
struct Movie {
    const char* name;
    int count; ///< of pictures
    double rate;
};
constexpr Movie kClock{"clock.mp4", 120, 30};
constexpr Movie kOneKeyframe{"long-gop.mp4", 1200, 60};

bool isBlack(const QColor& colour)
{
    return isNear(colour, QColor(0, 0, 0), 3);
}
bool isLight(const QColor& colour)
{
    return qGray(colour.rgb()) > 200;
}
/// What can be touched has this colour.
bool isBlue(const QColor& colour)
{
    return colour.blue() > colour.red() + 80;
}

class RealWindow : public testing::TestWithParam<int> {
protected:
    explicit RealWindow(int scale = 1) : m_screen(scale), m_scale(scale)
    {
        m_machine.set("QT_QPA_PLATFORM", "xcb");
        m_machine.set("DISPLAY", m_screen.name());
        m_machine.setScale(scale);
    }

    void start(const fs::path& movie, const Machine::Words& options = {})
    {
        Machine::Words words = {fs::path(CLIPSA_BIN) / "clipsa", "open", movie, "--device", "phone"};
        words.insert(words.end(), options.begin(), options.end());
        m_host = std::make_unique<Child>(words, m_machine.environment());
        ASSERT_TRUE(m_screen.waitForWindow()) << m_host->wait(Milliseconds(0)).err;
    }
    /// The editor's window, upright, with the movie's first picture.
    void open(const Movie& movie)
    {
        start(m_machine.movie(movie.name));
        ASSERT_NO_FATAL_FAILURE(waitFor("the first picture and the bars", [&](const Screenshot& picture) {
            return isUpright(picture) && number(picture) == 0 && isChromeShown(picture);
        }));
    }
    /// All is as it was before the editor came.
    void expectClosed()
    {
        const auto end = m_host->wait();
        EXPECT_TRUE(end.inTime);
        EXPECT_EQ(end.exitStatus, 0) << end.err;
        EXPECT_THAT(end.out, IsEmpty());
        EXPECT_THAT(end.err, IsEmpty());
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }
    void close()
    {
        m_screen.key(XKey::Escape);
        expectClosed();
    }

    QColor at(const Screenshot& picture, double x, double y) const { return picture.at(x * m_scale, y * m_scale); }
    bool isUpright(const Screenshot& picture) const
    {
        return picture.width() == kShort * m_scale && picture.height() == kLong * m_scale;
    }
    bool isOnItsSide(const Screenshot& picture) const
    {
        return picture.width() == kLong * m_scale && picture.height() == kShort * m_scale;
    }
    /// The number of the movie's picture; -1 when there is none, or something lies over it.
    int number(const Screenshot& picture) const
    {
        return isNear(picture.at(m_coded, 4, 4), QColor(63, 63, 63), 6) ? picture.number(m_coded) : -1;
    }
    /// Of an upright window: both bars and the strip between them, none paler than it should be.
    bool isChromeShown(const Screenshot& picture) const
    {
        // At its end, where no play head is.
        const int strip = qGray(at(picture, kShort - 4, kStripMiddle).rgb());
        return isLight(at(picture, 4, 4)) && isLight(at(picture, 4, kBarMiddle)) && strip > 150 && strip < 200;
    }
    bool isChromeHidden(const Screenshot& picture) const
    {
        for (const double x : {4.0, kShort / 2.0, kShort - 25.0})
            for (const double y : {4.0, kTopBar / 2, kStripMiddle, kBarMiddle})
                if (!isBlack(at(picture, x, y)))
                    return false;
        return true;
    }
    /// Of the bottom bar: play is one solid thing, pause is two.
    bool showsPlay(const Screenshot& picture) const { return blueThingsInBottomBar(picture) == 1; }
    bool showsPause(const Screenshot& picture) const { return blueThingsInBottomBar(picture) == 2; }
    int blueThingsInBottomBar(const Screenshot& picture) const
    {
        int things = 0;
        bool wasBlue = false;
        for (double x = 0; x < kShort; ++x) { // what is disabled is too pale to count
            const bool now = isBlue(at(picture, x, kBarMiddle));
            things += now && !wasBlue ? 1 : 0;
            wasBlue = now;
        }
        return things;
    }
    /// Of an upright window, whose strip may still be waiting for its pictures.
    QImage withoutStrip(const Screenshot& picture) const
    {
        QImage image = picture.image().copy();
        QPainter painter(&image);
        painter.scale(m_scale, m_scale);
        painter.fillRect(QRectF(0, kStripMiddle - kStrip / 2, kShort, kStrip), Qt::black);
        return image;
    }
    /// The picture that the strip has at `x`.
    static int numberUnder(double x, const Movie& movie)
    {
        const double part = (x - kStripInset) / (kShort - 2 * kStripInset);
        return std::min(static_cast<int>(part * movie.count), movie.count - 1);
    }

    void waitFor(const std::string& what, const std::function<bool(const Screenshot&)>& wanted)
    {
        const bool came = m_screen.waitFor(wanted);
        ASSERT_TRUE(came) << "no " << what << ": " << seen();
    }
    void waitForNumber(int wanted, int distance = 0)
    {
        waitFor("picture " + std::to_string(wanted), [&](const Screenshot& picture) {
            return number(picture) >= 0 && std::abs(number(picture) - wanted) <= distance;
        });
    }
    void waitForPlayingPast(int number)
    {
        waitFor("picture after " + std::to_string(number),
                [&](const Screenshot& picture) { return this->number(picture) > number; });
    }
    void waitForChrome()
    {
        waitFor("chrome", [&](const Screenshot& picture) { return isUpright(picture) && isChromeShown(picture); });
    }
    void waitForNoChrome()
    {
        waitFor("empty screen",
                [&](const Screenshot& picture) { return isUpright(picture) && isChromeHidden(picture); });
    }
    /// For messages.
    std::string seen()
    {
        const Screenshot picture = m_screen.picture();
        return picture.isNull() ? "there is no window"
                                : "the window is " + std::to_string(picture.width()) + "x"
                                      + std::to_string(picture.height()) + " and shows picture "
                                      + std::to_string(number(picture)) + ", its corner is " + words(picture.at(4, 4));
    }

    Machine m_machine;
    Screen m_screen;
    const int m_scale;
    std::unique_ptr<Child> m_host;
    const Coded m_coded;
};

class RealWindowOfScale : public RealWindow {
protected:
    RealWindowOfScale() : RealWindow(GetParam()) {}
};

constexpr double kAboveLargeGlyph = kLong / 2.0 - 35; ///< on the large button's disc

} // namespace

TEST_F(RealWindow, LooksAsInTheManualUprightAndOnItsSide)
{
    const auto movie = m_machine.movieFrom(fs::path(CLIPSA_TEST_MOVIES) / "pictures/phone.mp4");
    const timespec recorded{1715682240, 0}; // as tools/make-pictures has it: 2024-05-14 10:24 UTC
    const timespec times[2] = {recorded, recorded};
    ::utimensat(AT_FDCWD, movie.c_str(), times, 0);
    ASSERT_NO_FATAL_FAILURE(start(movie, {"--app-name", "Weekend trip"}));
    for (const char* name : {"phone@1x.png", "phone-landscape@1x.png", "phone@1x.png"}) {
        const Screenshot wanted(fs::path(CLIPSA_SOURCE) / "docs/pictures" / name);
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

/// What tests of a real window share: the editor's own process on an X server, steered by a pointer and keys whose events
/// come through the server, and judged by what the screen shows. The movie's picture says which one it is.
#pragma once

#include "end_to_end/Machine.h"
#include "end_to_end/Screen.h"

#include <QPainter>

#include <gmock/gmock.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>

namespace tests {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

// A phone with a home button; points.
inline constexpr int kShort = 390;
inline constexpr int kLong = 760;
inline constexpr double kTopBar = 60;
inline constexpr double kBottomBar = 44;
inline constexpr double kStrip = 38;
inline constexpr double kStripInset = 10 + 16; // to the pictures, behind a grip
inline constexpr double kShareEnd = 8 + 44;    ///< the bar's first item
inline constexpr double kBarMiddle = kLong - kBottomBar / 2;
inline constexpr double kStripMiddle = kLong - kBottomBar - kStrip / 2;

// As of the tests of docs/pictures.
inline constexpr double kLargestDifference = 7;
inline constexpr double kUnseen = 2; // of 255

/// A movie whose picture says its number.
struct Movie {
    const char* name;
    int count; ///< of pictures
    double rate;
};
inline constexpr Movie kClock{"clock.mp4", 120, 30};
inline constexpr Movie kOneKeyframe{"long-gop.mp4", 1200, 60};

inline bool isBlack(const QColor& colour)
{
    return isNear(colour, QColor(0, 0, 0), 3);
}
inline bool isLight(const QColor& colour)
{
    return qGray(colour.rgb()) > 200;
}
/// What can be touched has this colour.
inline bool isBlue(const QColor& colour)
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
        Machine::Words words = {program("clipsa"), "open", movie, "--device", "phone"};
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
        EXPECT_THAT(end.out, testing::IsEmpty());
        EXPECT_THAT(end.err, testing::IsEmpty());
        EXPECT_THAT(m_machine.remains(), testing::IsEmpty());
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
    /// Of the bottom bar, behind the share item: play is one solid thing, pause is two.
    bool showsPlay(const Screenshot& picture) const { return blueThingsInBottomBar(picture) == 1; }
    bool showsPause(const Screenshot& picture) const { return blueThingsInBottomBar(picture) == 2; }
    int blueThingsInBottomBar(const Screenshot& picture) const
    {
        int things = 0;
        bool wasBlue = false;
        for (double x = kShareEnd; x < kShort; ++x) {
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

inline constexpr double kAboveLargeGlyph = kLong / 2.0 - 35; ///< on the large button's disc

} // namespace tests

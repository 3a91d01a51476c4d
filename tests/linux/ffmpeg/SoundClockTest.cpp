#include "linux/ffmpeg/SoundClock.h"

#include <gtest/gtest.h>

namespace {

using namespace std::chrono_literals;

constexpr std::int64_t kSecond = ffmpeg::kSampleRate;

TEST(SoundClock, GoesByTheDevice)
{
    ffmpeg::SoundClock clock;
    clock.start(0, 10s, false);
    EXPECT_EQ(clock.frames(kSecond / 2, 10s + 900ms), kSecond / 2);
    EXPECT_EQ(clock.frames(kSecond / 2, 11s + 800ms), kSecond / 2) << "it may stand still";
    EXPECT_EQ(clock.frames(kSecond / 4, 11s + 900ms), kSecond / 2) << "never back";
    EXPECT_FALSE(clock.isOnItsOwn());
}

TEST(SoundClock, GoesOnWithoutADeviceThatStandsStillTooLong)
{
    ffmpeg::SoundClock clock;
    clock.start(0, 0s, false);
    EXPECT_EQ(clock.frames(kSecond / 2, 500ms), kSecond / 2);
    EXPECT_EQ(clock.frames(kSecond / 2, 1700ms), kSecond / 2 + kSecond / 5) << "from when it was given up";
    EXPECT_TRUE(clock.isOnItsOwn());
    EXPECT_EQ(clock.frames(kSecond / 2, 2500ms), kSecond / 2 + kSecond);
}

TEST(SoundClock, GoesByTheDeviceAgainWhenThatGoesOn)
{
    ffmpeg::SoundClock clock;
    clock.start(0, 0s, false);
    EXPECT_EQ(clock.frames(0, 3s), 2 * kSecond);
    EXPECT_EQ(clock.frames(kSecond / 10, 3s), 2 * kSecond) << "it is behind, and waited for";
    EXPECT_FALSE(clock.isOnItsOwn());
    EXPECT_EQ(clock.frames(2 * kSecond + 5, 3500ms), 2 * kSecond + 5);
    EXPECT_EQ(clock.frames(2 * kSecond + 5, 4500ms), 2 * kSecond + 5) << "by itself it would go on";
    EXPECT_EQ(clock.frames(2 * kSecond + 5, 5s), 2 * kSecond + 5 + kSecond / 2) << "given up once more";
}

TEST(SoundClock, OfADeviceThatComesLateGoesOnFromWhereTheRunIs)
{
    ffmpeg::SoundClock clock;
    clock.start(2 * kSecond, 7s, true);
    EXPECT_EQ(clock.frames(0, 7500ms), 2 * kSecond + kSecond / 2);
    EXPECT_EQ(clock.frames(2 * kSecond + kSecond / 2 + 7, 7500ms), 2 * kSecond + kSecond / 2 + 7);
    EXPECT_FALSE(clock.isOnItsOwn());
}

} // namespace

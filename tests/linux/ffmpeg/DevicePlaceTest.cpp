#include "linux/ffmpeg/DevicePlace.h"

#include <gtest/gtest.h>

namespace {

using namespace std::chrono_literals;
using ffmpeg::DevicePlace;

constexpr std::int64_t kMillisecond = ffmpeg::kSampleRate / 1000;
constexpr std::int64_t kLeadIn = DevicePlace::kLeadIn;

class Place : public testing::Test {
protected:
    DevicePlace place;
};

TEST_F(Place, IsWhereTheDeviceSaysThatItIsBehindTheLeadIn)
{
    place.give(200 * kMillisecond, 0ms);
    EXPECT_EQ(place.heard(0, 10ms), 0);
    EXPECT_EQ(place.heard(kLeadIn / 2, 30ms), 0) << "this is silence";
    EXPECT_EQ(place.heard(kLeadIn + 30 * kMillisecond, 80ms), 30 * kMillisecond);
}

TEST_F(Place, FollowsADeviceWhoseServerSettlesLater)
{
    place.give(200 * kMillisecond, 0ms);
    EXPECT_EQ(place.heard(kLeadIn + 30 * kMillisecond, 80ms), 30 * kMillisecond);
    place.give(200 * kMillisecond, 100ms);
    EXPECT_EQ(place.heard(kLeadIn + 60 * kMillisecond, 310ms), 60 * kMillisecond) << "by the clock it would be 260";
}

TEST_F(Place, GoesOnALittleBetweenTwoStepsOfTheDevice)
{
    place.give(400 * kMillisecond, 0ms);
    place.heard(kLeadIn + 30 * kMillisecond, 80ms);
    EXPECT_EQ(place.heard(kLeadIn + 30 * kMillisecond, 90ms), 40 * kMillisecond);
    EXPECT_EQ(place.heard(kLeadIn + 30 * kMillisecond, 300ms), 55 * kMillisecond) << "it stands still";
    EXPECT_EQ(place.heard(kLeadIn + 50 * kMillisecond, 310ms), 55 * kMillisecond) << "never back";
    EXPECT_EQ(place.heard(std::nullopt, 315ms), 55 * kMillisecond);
}

TEST_F(Place, IsNeverBehindWhatTheDeviceWasGiven)
{
    place.give(100 * kMillisecond, 0ms);
    EXPECT_EQ(place.heard(500 * kMillisecond, 300ms), 100 * kMillisecond - kLeadIn);
}

TEST_F(Place, OfADeviceThatNeverTellsIsReckonedFromWhatItAskedFor)
{
    EXPECT_EQ(place.heard(std::nullopt, 2000ms), 0) << "it has not asked yet";
    place.give(200 * kMillisecond, 2000ms);
    place.give(200 * kMillisecond, 2200ms);
    EXPECT_EQ(place.heard(std::nullopt, 2490ms), 0) << "it may still tell";
    place.give(200 * kMillisecond, 2500ms);
    EXPECT_EQ(place.heard(std::nullopt, 2510ms), 210 * kMillisecond - kLeadIn);
    EXPECT_EQ(place.heard(0, 9000ms), 600 * kMillisecond - kLeadIn) << "no more than it was given";
}

TEST_F(Place, OfADeviceThatHasDiedGoesOnInSilenceHoweverOftenItSaysSo)
{
    place.give(200 * kMillisecond, 0ms);
    place.heard(kLeadIn + 30 * kMillisecond, 80ms);
    place.fail(1000ms);
    EXPECT_EQ(place.heard(std::nullopt, 1500ms), 530 * kMillisecond);
    place.fail(1500ms);
    EXPECT_EQ(place.heard(std::nullopt, 2000ms), 1030 * kMillisecond);
}

} // namespace

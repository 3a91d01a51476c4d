#include "support/TempMovieNames.h"
#include "support/VKDateExtensions.h"

#include "linux/icu/Calendar.h"
#include "support/FakeCalendar.h"

#include <gmock/gmock.h>

namespace {

using testing::ElementsAre;

constexpr const char* kTempPath = "/private/var/mobile/Library/Velkor/";

TEST(TheNameOfATemporaryMovie, IsStemSecondsAndExtensionBehindADoubledSlash)
{
    EXPECT_EQ(support::tempMovieUrl(support::tempMovieStem(kTempPath, support::kMixedMovieName), {1'700'000'000.9}),
              base::Url::fromPath("/private/var/mobile/Library/Velkor//VKClipsa_Final1700000000.mp4"));
    EXPECT_EQ(support::tempMovieUrl(support::tempMovieStem(kTempPath, support::kUploadMovieName), {1'700'000'000}),
              base::Url::fromPath("/private/var/mobile/Library/Velkor//VKClipsa_YouTube1700000000.mp4"));
    EXPECT_EQ(support::tempMovieUrl(support::tempMovieStem(kTempPath, support::trimmedMovieName("Chess")), {5.5}),
              base::Url::fromPath("/private/var/mobile/Library/Velkor//Chess_5.mp4"));
}

TEST(TheNameOfATemporaryMovie, TruncatesTheTimeTowardZeroAndKeepsItsSign)
{
    EXPECT_EQ(support::tempMovieUrl("/a", {-1.9}).path(), "/a-1.mp4");
    EXPECT_EQ(support::tempMovieUrl("/a", {-0.9}).path(), "/a0.mp4");
    EXPECT_EQ(support::tempMovieUrl("/a", {4e12}).path(), "/a4000000000000.mp4");
}

TEST(TheNameOfATemporaryMovie, IsTheSameTwiceInASecond)
{
    EXPECT_EQ(support::tempMovieUrl("/a", {10.1}), support::tempMovieUrl("/a", {10.9}));
}

TEST(TheNameOfATemporaryMovie, KeepsTheLettersOfAnAppName)
{
    const auto url =
        support::tempMovieUrl(support::tempMovieStem(kTempPath, support::trimmedMovieName("Šach %i")), {7});
    EXPECT_EQ(url.lastPathComponent(), "Šach %i_7.mp4");
}

TEST(TheNameOfATemporaryMovie, HasNothingThatNoFileNameMayHave)
{
    EXPECT_EQ(support::trimmedMovieName("AC/DC"), "AC\u2044DC_");
    EXPECT_EQ(support::trimmedMovieName(std::string("a\0b\nc\x7F", 6)), "a b c _");
    EXPECT_EQ(support::trimmedMovieName("\x1F !~\x80"), "  !~\x80_") << "the last of those, and what is none";
    EXPECT_EQ(support::trimmedMovieName(".."), ".._");
    EXPECT_EQ(support::trimmedMovieName(""), "_");
}

TEST(TheNameOfATemporaryMovie, HasTwoHundredBytesOfTheAppsAtMostAndWholeLetters)
{
    const auto letters = [](std::string_view letter, int count) {
        std::string text;
        for (int i = 0; i < count; ++i)
            text += letter;
        return text;
    };
    EXPECT_EQ(support::trimmedMovieName(letters("x", 200)), letters("x", 200) + "_");
    EXPECT_EQ(support::trimmedMovieName(letters("x", 201)), letters("x", 200) + "_");
    // Letters of two, three and four bytes, with all kinds of continuations, cut at each of their bytes.
    for (const std::string_view letter : {"\u0436", "\u0439", "\u20AC", "\uFFFD", "\U0001F3AC", "\U0001F3BF"})
        for (std::size_t before = 0; before < letter.size(); ++before) {
            SCOPED_TRACE(std::string(letter) + " behind " + std::to_string(before));
            const std::string lead = letters("x", static_cast<int>(before));
            const auto whole = static_cast<int>((200 - before) / letter.size());
            EXPECT_EQ(support::trimmedMovieName(lead + letters(letter, 200)), lead + letters(letter, whole) + "_");
        }
    EXPECT_EQ(support::trimmedMovieName(letters("\x80", 201)), "_") << "no text at all";
}

TEST(TheTextOfADate, NeedsANewFormatterEveryTimeAndStaysInTheDevicesZone)
{
    const tests::FakeCalendar calendar;
    EXPECT_EQ(VKExtensions::_srGetStringFromDate(calendar, {42}), "MMMM d hh:mm a @ 42");
    EXPECT_EQ(VKExtensions::_srGetStringFromDate(calendar, {43}), "MMMM d hh:mm a @ 43");
    EXPECT_EQ(calendar.formattersMade, 2);
    EXPECT_THAT(calendar.zonesAskedFor, ElementsAre("...", "..."));
    EXPECT_THAT(calendar.zonesSet, ElementsAre("device", "device"));
}

TEST(TheTextOfADate, IsMonthDayAndTimeInAnEnglishLocaleInTheDevicesZone)
{
    constexpr base::Date kMarch5{1709669220}; // 5 March 2024, 20:07 UTC
    const intl::Calendar calendar([](const char* name) -> std::string {
        const std::string_view variable(name);
        return variable == "LANG" ? "en_US.UTF-8" : variable == "TZ" ? "Europe/Berlin" : "";
    });
    EXPECT_EQ(VKExtensions::_srGetStringFromDate(calendar, kMarch5), "March 5 09:07 PM");
}

} // namespace

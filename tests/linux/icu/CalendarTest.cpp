#include "linux/icu/Calendar.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <map>

namespace {

constexpr base::Date kMarch5{1709669220}; // 5 March 2024, 20:07 UTC: 21:07 in Berlin
constexpr const char* kPattern = "MMMM d hh:mm a";

class ACalendar : public testing::Test {
protected:
    std::map<std::string, std::string> environment = {{"LANG", "en_US.UTF-8"}, {"TZ", "Europe/Berlin"}};
    intl::Calendar calendar{[this](const char* name) {
        const auto found = environment.find(name);
        return found != environment.end() ? found->second : "";
    }};

    std::string text(base::Date date = kMarch5, const char* pattern = kPattern) const
    {
        const auto formatter = calendar.makeDateFormatter();
        formatter->setDateFormat(pattern);
        return formatter->stringFromDate(date);
    }
};

TEST_F(ACalendar, WritesMonthDayAndTimeInEnglish)
{
    EXPECT_EQ(text(), "March 5 09:07 PM");
}

TEST_F(ACalendar, WritesInTheLanguageOfItsLocale)
{
    environment["LANG"] = "de_DE.UTF-8";
    EXPECT_EQ(text(), "März 5 09:07 PM");
    environment["LANG"] = "fr_FR";
    EXPECT_EQ(text(), "mars 5 09:07 PM");
}

TEST_F(ACalendar, PrefersTheStrongestVariableThatIsNotEmpty)
{
    environment["LC_TIME"] = "de_DE.UTF-8";
    EXPECT_EQ(text(), "März 5 09:07 PM");
    environment["LC_ALL"] = "fr_FR.UTF-8";
    EXPECT_EQ(text(), "mars 5 09:07 PM");
    environment["LC_ALL"] = environment["LC_TIME"] = "";
    EXPECT_EQ(text(), "March 5 09:07 PM");
}

TEST_F(ACalendar, WritesEnglishWithoutALocale)
{
    for (const char* name : {"", "C", "C.UTF-8", "POSIX"}) {
        environment["LANG"] = name;
        EXPECT_EQ(text(), "March 5 09:07 PM") << name;
    }
}

TEST_F(ACalendar, WritesInTheScriptOfItsLocale)
{
    environment["LANG"] = "sr_RS.UTF-8";
    EXPECT_EQ(text(kMarch5, "MMMM"), "март");
    environment["LANG"] = "sr_RS.UTF-8@latin";
    EXPECT_EQ(text(kMarch5, "MMMM"), "mart");
}

TEST_F(ACalendar, FollowsTheDeviceToAnotherZoneAndLocaleWithTheNextFormatter)
{
    const auto before = calendar.makeDateFormatter();
    before->setDateFormat(kPattern);
    environment["TZ"] = "America/New_York";
    environment["LANG"] = "de_DE.UTF-8";
    EXPECT_EQ(before->stringFromDate(kMarch5), "March 5 09:07 PM");
    EXPECT_EQ(text(), "März 5 03:07 PM");
}

TEST_F(ACalendar, KnowsSummerTime)
{
    constexpr base::Date kJuly5{1720202820}; // 18:07 UTC
    EXPECT_EQ(text(kJuly5), "July 5 08:07 PM");
}

TEST_F(ACalendar, UnderstandsZonesWithAColonBefore)
{
    environment["TZ"] = ":Asia/Tokyo";
    EXPECT_EQ(text(), "March 6 05:07 AM");
}

TEST_F(ACalendar, HasNoZoneOfANameThatNoZoneHas)
{
    for (const char* name : {"...", "", "Etc/Unknown", "Nowhere/Atlantis", "\xff"})
        EXPECT_FALSE(calendar.timeZoneWithName(name)) << name;
}

TEST_F(ACalendar, HasZonesThatExist)
{
    ASSERT_TRUE(calendar.timeZoneWithName("Asia/Tokyo"));
    EXPECT_EQ(calendar.timeZoneWithName("Asia/Tokyo")->name, "Asia/Tokyo");
}

TEST_F(ACalendar, SetsAFormattersZoneAndKeepsTheDevicesWhenGivenNothing)
{
    const auto formatter = calendar.makeDateFormatter();
    formatter->setDateFormat(kPattern);
    formatter->setTimeZone(calendar.timeZoneWithName("..."));
    EXPECT_EQ(formatter->stringFromDate(kMarch5), "March 5 09:07 PM");
    formatter->setTimeZone(calendar.timeZoneWithName("Asia/Tokyo"));
    EXPECT_EQ(formatter->stringFromDate(kMarch5), "March 6 05:07 AM");
}

TEST_F(ACalendar, WritesMidnightAndNoonAsTwelve)
{
    environment["TZ"] = "UTC";
    EXPECT_EQ(text({1709596800}), "March 5 12:00 AM");
    EXPECT_EQ(text({1709640000}), "March 5 12:00 PM");
}

TEST_F(ACalendar, SurvivesDatesThatAreNone)
{
    for (const double seconds : {std::nan(""), 1e300, -1e300})
        static_cast<void>(text({seconds}));
}

TEST(TheCalendarOfTheProcess, ReadsItsEnvironmentAtEveryFormatter)
{
    const intl::Calendar calendar;
    ::setenv("LC_ALL", "en_GB.UTF-8", 1);
    for (const auto& [zone, expected] :
         {std::pair("Europe/Berlin", "21:07"), std::pair("UTC", "20:07"),
          // As POSIX writes zones, west of Greenwich positive.
          std::pair("XYZ-5:30", "01:37"), std::pair("CET-1CEST,M3.5.0,M10.5.0/3", "21:07")}) {
        ::setenv("TZ", zone, 1);
        const auto formatter = calendar.makeDateFormatter();
        formatter->setDateFormat("HH:mm");
        EXPECT_EQ(formatter->stringFromDate(kMarch5), expected) << zone;
    }
    ::unsetenv("TZ");
    ::unsetenv("LC_ALL");
}

TEST(ALocaleOfIcu, HasNoCodesetAndScriptsForModifiers)
{
    EXPECT_EQ(intl::localeFromPosixName("de_AT.UTF-8"), "de_AT");
    EXPECT_EQ(intl::localeFromPosixName("de_DE@euro"), "de_DE");
    EXPECT_EQ(intl::localeFromPosixName("de_DE.ISO-8859-15@euro"), "de_DE");
    EXPECT_EQ(intl::localeFromPosixName("sr_RS.UTF-8@latin"), "sr_Latn_RS");
    EXPECT_EQ(intl::localeFromPosixName("sr@latin"), "sr_Latn");
    EXPECT_EQ(intl::localeFromPosixName("uz_UZ@cyrillic"), "uz_Cyrl_UZ");
    EXPECT_EQ(intl::localeFromPosixName("fr"), "fr");
    EXPECT_EQ(intl::localeFromPosixName(""), "en_US_POSIX");
    EXPECT_EQ(intl::localeFromPosixName("@latin"), "en_US_POSIX");
}

} // namespace

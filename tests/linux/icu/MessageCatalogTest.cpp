#include "linux/icu/MessageCatalog.h"

#include "support/FakeBundles.h"

#include <gtest/gtest.h>

#include <limits>

namespace {

class ACatalog : public testing::Test {
protected:
    ACatalog()
    {
        const auto bundle = bundles.add("/words");
        for (const char* language : {"en", "pl", "ar", "de"}) {
            bundle->languages.emplace_back(language);
            bundles.add(std::string("/words/") + language + ".lproj");
        }
        words("en") = {{"SAVE", "Save"},
                       {"ENGLISH", "Only in English"},
                       {"MOVIES", "{count, plural, one {# movie of {app}} other {# movies of {app}}}"},
                       {"SIZE", "{size, number} MB"}};
        words("pl") = {{"SAVE", "Zapisz"},
                       {"MOVIES", "{count, plural, one {# film} few {# filmy} many {# filmów} other {# filmu}}"},
                       {"BROKEN", "{count, plural, one {"}};
        words("ar") = {{"SAVE", "حفظ"}, {"MOVIES", "{count}"}};
        words("de") = {{"SIZE", "{size, number} MB"}, {"QUOTE", "„{app}“ ist’s, l'app '{'x'}'"}};
    }

    platform::StringsTable& words(const char* language)
    {
        return bundles.at(std::string("/words/") + language + ".lproj")->tables["Localizable"];
    }
    intl::MessageCatalog catalog(std::vector<std::string> preferred)
    {
        bundles.spoken.preferred = std::move(preferred);
        return {bundles, "/words"};
    }

    tests::FakeBundles bundles;
};

TEST_F(ACatalog, SpeaksTheUsersLanguage)
{
    EXPECT_EQ(catalog({"pl-PL"}).text("SAVE"), "Zapisz");
    EXPECT_EQ(catalog({"ja", "ar"}).text("SAVE"), "حفظ");
}

TEST_F(ACatalog, SpeaksEnglishWhereItHasNoOtherWords)
{
    EXPECT_EQ(catalog({"ja"}).text("SAVE"), "Save");
    EXPECT_EQ(catalog({"pl"}).text("ENGLISH"), "Only in English");
    EXPECT_EQ(catalog({"pl"}).text("NOWHERE"), "NOWHERE");
    EXPECT_EQ(catalog({"pl"}).text("NOWHERE", {{"a", "b"}}), "NOWHERE");
    bundles.remove("/words");
    EXPECT_EQ(catalog({"pl"}).text("SAVE"), "Save");
    bundles.remove("/words/en.lproj");
    EXPECT_EQ(catalog({"pl"}).text("SAVE"), "SAVE");
}

TEST_F(ACatalog, HasFormsForNumbersAsTheLanguageHasThem)
{
    const auto polish = catalog({"pl"});
    EXPECT_EQ(polish.text("MOVIES", {{"count", 1}}), "1 film");
    EXPECT_EQ(polish.text("MOVIES", {{"count", 3}}), "3 filmy");
    EXPECT_EQ(polish.text("MOVIES", {{"count", 12}}), "12 filmów");
    EXPECT_EQ(polish.text("MOVIES", {{"count", 1.5}}), "1,5 filmu");
    EXPECT_EQ(catalog({"en"}).text("MOVIES", {{"app", "Tux"}, {"count", 2}}), "2 movies of Tux");
}

TEST_F(ACatalog, WritesNumbersAsWhereTheUserLives)
{
    EXPECT_EQ(catalog({"de-DE"}).text("SIZE", {{"size", 1234.5}}), "1.234,5 MB");
    EXPECT_EQ(catalog({"de-CH"}).text("SIZE", {{"size", 1234.5}}), "1’234.5 MB");
    EXPECT_EQ(catalog({"ar-EG"}).text("MOVIES", {{"count", 12}}), "١٢");
}

TEST_F(ACatalog, SaysTimesInWords)
{
    const auto english = catalog({"en"});
    EXPECT_EQ(english.duration(0, 0), "0 seconds");
    EXPECT_EQ(english.duration(1, 0), "1 second");
    EXPECT_EQ(english.duration(59.99, 0), "59 seconds");
    EXPECT_EQ(english.duration(0.1 + 0.2 + 59.7, 0), "1 minute, 0 seconds");
    EXPECT_EQ(english.duration(65.256, 2), "1 minute, 5.25 seconds");
    EXPECT_EQ(english.duration(3600, 0), "1 hour, 0 minutes, 0 seconds");
    EXPECT_EQ(english.duration(7384.5, 1), "2 hours, 3 minutes, 4.5 seconds");
    EXPECT_EQ(english.duration(-1, 0), "0 seconds");
    EXPECT_EQ(english.duration(std::numeric_limits<double>::quiet_NaN(), 0), "0 seconds");
    EXPECT_EQ(english.duration(std::numeric_limits<double>::infinity(), 0), "0 seconds");
    EXPECT_EQ(catalog({"pl"}).duration(122, 0), "2 minuty i 2 sekundy");
    EXPECT_EQ(catalog({"de"}).duration(1.5, 2), "1,5 Sekunden");
}

TEST_F(ACatalog, TakesTextsAsTheyAre)
{
    EXPECT_EQ(catalog({"de"}).text("QUOTE", {{"app", "{x} 'y' %@"}}), "„{x} 'y' %@“ ist’s, l'app {x}");
    EXPECT_EQ(catalog({"de"}).text("QUOTE", {{"other", "x"}}), "„{app}“ ist’s, l'app {x}")
        << "a place that is not filled";
}

TEST_F(ACatalog, GivesWhatStandsInABrokenTable)
{
    EXPECT_EQ(catalog({"pl"}).text("BROKEN", {{"count", 1}}), "{count, plural, one {");
}

TEST_F(ACatalog, KnowsWhereItsWordsBegin)
{
    EXPECT_TRUE(catalog({"ar-EG"}).isRightToLeft());
    EXPECT_FALSE(catalog({"pl"}).isRightToLeft());
    EXPECT_FALSE(catalog({"he"}).isRightToLeft()) << "it speaks English then";
}

TEST_F(ACatalog, ShowsTimesAsClocksDo)
{
    const auto english = catalog({"en"});
    EXPECT_EQ(english.clock(0), "0:00");
    EXPECT_EQ(english.clock(42.99), "0:42");
    EXPECT_EQ(english.clock(605), "10:05");
    EXPECT_EQ(english.clock(3723), "1:02:03");
    EXPECT_EQ(english.clock(-5), "0:00");
    EXPECT_EQ(english.clock(std::numeric_limits<double>::quiet_NaN()), "0:00");
    EXPECT_EQ(catalog({"ar-EG"}).clock(42), "٠:٤٢");
}

TEST_F(ACatalog, SaysHowLargeFilesAre)
{
    const auto english = catalog({"en"});
    EXPECT_EQ(english.fileSize(0), "0 byte");
    EXPECT_EQ(english.fileSize(999), "999 byte");
    EXPECT_EQ(english.fileSize(1000), "1 kB");
    EXPECT_EQ(english.fileSize(12'400'000), "12.4 MB");
    EXPECT_EQ(english.fileSize(999'950), "1 MB") << "not 1,000 kB";
    EXPECT_EQ(english.fileSize(345'678'901), "346 MB");
    EXPECT_EQ(english.fileSize(2'500'000'000), "2.5 GB");
    EXPECT_EQ(english.fileSize(-3), "0 byte");
    EXPECT_EQ(english.fileSize(std::numeric_limits<std::int64_t>::max()), "9,223,372 TB");
    EXPECT_EQ(catalog({"de-DE"}).fileSize(12'400'000), "12,4 MB");
}

TEST_F(ACatalog, ListsNamesAsTheLanguageDoes)
{
    EXPECT_EQ(catalog({"en"}).list({"a", "b", "c"}), "a, b, and c");
    EXPECT_EQ(catalog({"de"}).list({"a", "b"}), "a und b");
    EXPECT_EQ(catalog({"de"}).list({"a"}), "a");
    EXPECT_EQ(catalog({"de"}).list({}), "");
}

} // namespace

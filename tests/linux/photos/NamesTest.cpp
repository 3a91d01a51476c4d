// What recordings are called in the library.

#include "linux/photos/LibraryFixture.h"
#include "linux/photos/LibraryName.h"

namespace {

using photos::fileNameSafe;
using photos::libraryName;

const base::Date kDate = tests::localDate(2026, 11, 21, 15, 4, 5);

std::string nameOf(const std::string& app, const std::string& path = "/a/movie.mp4")
{
    return libraryName(app, kDate, path).numbered(1);
}

TEST(ALibraryName, IsTheAppAndTheDateInLocalTime)
{
    EXPECT_EQ(nameOf("Tux Racer"), "Tux Racer 2026-11-21 15-04-05.mp4");
    EXPECT_EQ(libraryName("Tux Racer", kDate, "a.mp4").numbered(2), "Tux Racer 2026-11-21 15-04-05 (2).mp4");
    EXPECT_EQ(libraryName("Tux Racer", kDate, "a.mp4").numbered(10), "Tux Racer 2026-11-21 15-04-05 (10).mp4");
    EXPECT_EQ(libraryName("A", {kDate.secondsSince1970 + 0.999}, "a").numbered(1), "A 2026-11-21 15-04-05.mp4");
}

TEST(ALibraryName, HasTheDateOnce)
{
    for (const char* app : {"Screencast from 2026-11-21 15-03-59", "Screencast from 2026-11-21 15-03-59 (2)",
                            "Screencast from - 20261121_150359", "Screencast from_2026-11-21_15.03.59.123",
                            "Screencast from 2026-11-21 at 15.03.59", "Screencast from 2026-11-21T15:03:59"})
        EXPECT_EQ(nameOf(app), "Screencast from 2026-11-21 15-04-05.mp4") << app;
    EXPECT_EQ(nameOf("2026-11-21 15-03-59"), "2026-11-21 15-04-05.mp4");
    EXPECT_EQ(nameOf(""), "Recording 2026-11-21 15-04-05.mp4");
    const std::string longName(200, 'x');
    EXPECT_EQ(nameOf(longName + " 2026-11-21 15-03-59"), nameOf(longName));
    // Numbers that are no date.
    EXPECT_EQ(nameOf("Level 2026"), "Level 2026 2026-11-21 15-04-05.mp4");
    EXPECT_EQ(nameOf("Call 12345678 1504"), "Call 12345678 1504 2026-11-21 15-04-05.mp4");
    EXPECT_EQ(nameOf("2026-11-21 15-03-59 best of"), "2026-11-21 15-03-59 best of 2026-11-21 15-04-05.mp4");
}

TEST(ALibraryName, HasTheExtensionOfTheMovieIfThatIsOne)
{
    EXPECT_EQ(libraryName("A", kDate, "/a/b.webm").extension, ".webm");
    EXPECT_EQ(libraryName("A", kDate, "/a/b.MKV").extension, ".mkv");
    EXPECT_EQ(libraryName("A", kDate, "/a/b.mpeg2").extension, ".mpeg2");
    EXPECT_EQ(libraryName("A", kDate, "/a/b.matroska").extension, ".mp4");
    EXPECT_EQ(libraryName("A", kDate, "/a/b.mpegts").extension, ".mp4") << "six letters are too many";
    EXPECT_EQ(libraryName("A", kDate, "/a/b").extension, ".mp4");
    EXPECT_EQ(libraryName("A", kDate, "/a.webm/b").extension, ".mp4");
    EXPECT_EQ(libraryName("A", kDate, "/a/.hidden").extension, ".mp4");
    EXPECT_EQ(libraryName("A", kDate, "/a/b.").extension, ".mp4");
    EXPECT_EQ(libraryName("A", kDate, "/a/b.a\nb").extension, ".mp4");
    EXPECT_EQ(libraryName("A", kDate, "/a/version 2.final cut").extension, ".mp4");
}

TEST(ALibraryName, IsSafeOnEveryFileSystem)
{
    EXPECT_EQ(fileNameSafe("AC/DC: Live"), "AC-DC- Live");
    EXPECT_EQ(fileNameSafe("a\\b*c?d\"e<f>g|h"), "a-b-c-d-e-f-g-h");
    EXPECT_EQ(fileNameSafe("../../etc/passwd"), "etc-passwd");
    EXPECT_EQ(fileNameSafe("a\nb\tc  d "), "a b c d");
    EXPECT_EQ(fileNameSafe(std::string("a\0b\x1b[1m", 7)), "a\uFFFDb[1m");
    EXPECT_EQ(fileNameSafe(".hidden"), "hidden");
    EXPECT_EQ(fileNameSafe("--option"), "option");
    EXPECT_EQ(fileNameSafe("gpj.\xE2\x80\xAEtxt"), "gpj.txt") << "nothing turns the text around";
}

TEST(ALibraryName, KeepsWhatOtherLanguagesNeed)
{
    EXPECT_EQ(fileNameSafe("Überflieger 2"), "Überflieger 2");
    EXPECT_EQ(fileNameSafe("東方"), "東方");
    EXPECT_EQ(fileNameSafe("می\u200Cخواهم"), "می\u200Cخواهم");
    EXPECT_EQ(fileNameSafe("👩\u200D💻"), "👩\u200D💻");
    EXPECT_EQ(fileNameSafe("a\u200Eb\u200Bc"), "abc") << "these have no width, and join nothing";
}

TEST(ALibraryName, IsThereEvenIfTheAppHasNone)
{
    for (const char* nothing : {"", " ", "...", "/", "\n", "\u202E"})
        EXPECT_EQ(fileNameSafe(nothing), "Recording") << nothing;
}

TEST(ALibraryName, IsTextEvenIfTheAppsIsNot)
{
    EXPECT_EQ(fileNameSafe("a\xFFz"), "a\uFFFDz");
}

TEST(ALibraryName, IsCutBetweenLettersWhenItIsTooLong)
{
    std::string letters;
    for (int i = 0; i < 200; ++i)
        letters += "ü";
    EXPECT_EQ(fileNameSafe("a" + letters), "a" + letters.substr(0, 94));
    EXPECT_EQ(fileNameSafe(letters), letters.substr(0, 96));
    EXPECT_EQ(fileNameSafe(std::string(94, 'a') + " bcd"), std::string(94, 'a') + " b") << "all of the room is used";
    EXPECT_EQ(fileNameSafe(std::string(95, 'a') + " bcd"), std::string(95, 'a')) << "no space is left at its end";
    EXPECT_LE(libraryName(letters, kDate, "a.webm").numbered(9999).size(), 143U) << "for encrypted directories";
}

} // namespace

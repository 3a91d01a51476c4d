// The words of the commands that need no window: what each takes, how far, and what it says of the rest.
#include "app/host/ClipsaProgram.h"

#include <gmock/gmock.h>

namespace {

using testing::EndsWith;
using testing::HasSubstr;
using testing::StartsWith;

using tests::parsed;
using tests::refusal;
using tests::Words;

const std::string kAccepted = "(accepted)";

TEST(MediaCommands, AreSix)
{
    for (const char* name : {"trim", "mix", "thumbnails", "probe", "save", "share"})
        EXPECT_TRUE(host::isMediaCommand(name)) << name;
    for (const char* name : {"", "open", "Trim", "tri", "trimm", "tour", "service"})
        EXPECT_FALSE(host::isMediaCommand(name)) << name;
}

TEST(MediaCommands, AskForHelpAnywhereButInAValue)
{
    for (const char* name : {"trim", "mix", "thumbnails", "probe", "save", "share"})
        for (const Words& words : {Words{name, "--help"}, Words{name, "m", "-h"}, Words{name, "-h", "--nonsense"}}) {
            const auto command = host::parseMediaCommand(words);
            ASSERT_TRUE(command);
            EXPECT_FALSE(command.value()) << name;
        }
    EXPECT_EQ(parsed<host::SaveCommand>({"save", "m", "--app-name", "--help"}).appName, "--help");
    EXPECT_EQ(parsed<host::SaveCommand>({"save", "--", "--help"}).movie, "--help");
}

TEST(MediaCommands, NeedOneMovieWithAName)
{
    const Words kRests[] = {{"trim", "-o", "o"}, {"mix", "-o", "o"}, {"thumbnails", "-o", "d", "-n", "1"},
                            {"probe"},           {"save"},           {"share", "--list"}};
    for (const Words& rest : kRests) {
        const auto with = [&](const Words& movies) {
            Words words = rest;
            words.insert(words.end(), movies.begin(), movies.end());
            return refusal(words);
        };
        EXPECT_THAT(with({}), StartsWith(rest.front() + " needs a movie"));
        EXPECT_EQ(with({"m"}), kAccepted);
        EXPECT_THAT(with({""}), StartsWith("the movie's name is empty"));
        EXPECT_THAT(with({"m", "n"}), StartsWith("one movie at a time: both m and n are given"));
        EXPECT_THAT(with({"m", "--nonsense"}), StartsWith(rest.front() + " has no option --nonsense"));
        EXPECT_THAT(with({"--nonsense"}), EndsWith("(see clipsa --help)"));
    }
}

TEST(MediaCommands, WriteWhereTheyAreToldByEitherName)
{
    for (const char* option : {"-o", "--output"}) {
        EXPECT_EQ(parsed<host::TrimCommand>({"trim", "m", option, "x"}).output, "x");
        EXPECT_EQ(parsed<host::MixCommand>({"mix", "m", option, "x"}).output, "x");
        EXPECT_EQ(parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-n", "2", option, "x"}).output, "x");
        for (const char* name : {"trim", "mix", "thumbnails"}) {
            EXPECT_THAT(refusal({name, "m", option}), StartsWith(std::string(option) + " needs a value"));
            EXPECT_THAT(refusal({name, "m", option, "\xFF"}), StartsWith("the value of "));
        }
    }
    EXPECT_THAT(refusal({"trim", "m"}), StartsWith("trim needs -o OUT"));
    EXPECT_THAT(refusal({"mix", "m"}), StartsWith("mix needs -o OUT"));
    EXPECT_THAT(refusal({"thumbnails", "m", "-n", "2"}), StartsWith("thumbnails needs -o DIR"));
    EXPECT_THAT(refusal({"thumbnails", "m", "-o", "d"}), StartsWith("thumbnails needs -n N"));
}

TEST(MediaCommands, ReplaceFilesOnlyWhenTold)
{
    EXPECT_FALSE(parsed<host::TrimCommand>({"trim", "m", "-o", "x"}).force);
    EXPECT_TRUE(parsed<host::TrimCommand>({"trim", "m", "-o", "x", "--force"}).force);
    EXPECT_FALSE(parsed<host::MixCommand>({"mix", "m", "-o", "x"}).force);
    EXPECT_TRUE(parsed<host::MixCommand>({"mix", "--force", "m", "-o", "x"}).force);
    EXPECT_FALSE(parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-n", "1", "-o", "x"}).force);
    EXPECT_TRUE(parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-n", "1", "-o", "x", "--force"}).force);
    EXPECT_FALSE(parsed<host::ProbeCommand>({"probe", "m"}).json);
    EXPECT_TRUE(parsed<host::ProbeCommand>({"probe", "m", "--json"}).json);
    for (const char* name : {"trim", "mix", "thumbnails"})
        EXPECT_THAT(refusal({name, "m", "--force=yes"}), StartsWith("--force takes no value"));
}

TEST(MediaCommands, MakeUpToTenThousandPictures)
{
    EXPECT_EQ(parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-o", "d", "-n", "1"}).count, 1);
    EXPECT_EQ(parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-o", "d", "--count=10000"}).count, 10'000);
    EXPECT_EQ(parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-o", "d", "--count=3"}).size, (base::Size{0, 0}));
    EXPECT_THAT(refusal({"thumbnails", "m", "-o", "d", "--count", "10001"}),
                StartsWith("--count is a number from 1 to 10000, not \"10001\""));
    EXPECT_THAT(refusal({"thumbnails", "m", "-o", "d", "-n"}), StartsWith("-n needs a value"));
}

TEST(MediaCommands, FitPicturesIntoWhatCanBeDrawn)
{
    const auto size = [](const std::string& text) {
        return parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-o", "d", "-n", "1", "--size", text}).size;
    };
    EXPECT_EQ(size("1x1"), (base::Size{1, 1}));
    EXPECT_EQ(size("16384x2"), (base::Size{16'384, 2}));
    EXPECT_EQ(size("2x16384"), (base::Size{2, 16'384}));
    for (const char* text : {"16385x2", "2x16385", "0x2", "2x0", "", "x", "5"})
        EXPECT_THAT(refusal({"thumbnails", "m", "-o", "d", "-n", "1", "--size", text}),
                    StartsWith("--size is a width and a height like 320x180, not \""))
            << text;
}

TEST(MediaCommands, KnowTimesToTheMicrosecond)
{
    const auto microseconds = [](const std::string& text) {
        const auto moment = host::momentIn(text);
        EXPECT_TRUE(!moment || moment->timescale == 1'000'000);
        return moment ? moment->value : -1;
    };
    EXPECT_EQ(microseconds("0.000001"), 1);
    EXPECT_EQ(microseconds("0.1"), 100'000);
    EXPECT_EQ(microseconds("7.654321"), 7'654'321);
    EXPECT_EQ(microseconds("7.6543219"), 7'654'321) << "what is finer is left out";
    EXPECT_EQ(microseconds("60"), 60'000'000);
    EXPECT_EQ(microseconds("0:59"), 59'000'000);
    EXPECT_EQ(microseconds("60:00"), 3'600'000'000);
    EXPECT_EQ(microseconds("100:59:59.5"), (100 * 3600 + 59 * 60 + 59) * std::int64_t{1'000'000} + 500'000);
    for (const char* text : {"0:60", "1:60:00", "0:0:0:0", "1::1", "::", "1.2.3", "1.-1"})
        EXPECT_EQ(microseconds(text), -1) << text;
}

TEST(MediaCommands, CutBetweenTwoTimesInTheirOrder)
{
    EXPECT_EQ(refusal({"trim", "m", "-o", "o", "--from", "1", "--to", "1.000001"}), kAccepted);
    EXPECT_THAT(refusal({"trim", "m", "-o", "o", "--from", "1", "--to", "1"}),
                StartsWith("--to must be behind --from"));
    EXPECT_THAT(refusal({"trim", "m", "-o", "o", "--to", "0"}), StartsWith("--to must be behind --from"));
    for (const char* option : {"--from", "--to"}) {
        EXPECT_THAT(refusal({"trim", "m", "-o", "o", option}), StartsWith(std::string(option) + " needs a value"));
        EXPECT_THAT(refusal({"trim", "m", "-o", "o", option, "soon"}), StartsWith(std::string(option) + " is a time"));
    }
}

TEST(MediaCommands, WriteMoviesUnderTheNamesOfTheirKind)
{
    for (const char* output : {"a.webm", "A.WEBM", "A.ASF", "a.Mkv", "a.y4m", "a.mp4.3gp"})
        for (const char* name : {"trim", "mix"})
            EXPECT_THAT(refusal({name, "m", "-o", output}),
                        HasSubstr(std::string(name) + " writes an MP4 movie, and " + output + " is the name"));
}

} // namespace

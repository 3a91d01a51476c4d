#include "app/host/CommandLine.h"

#include <gmock/gmock.h>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

using Words = std::vector<std::string>;

host::OpenCommand open(const Words& words)
{
    const auto command = host::parseCommandLine(words);
    EXPECT_TRUE(command) << command.error()->description();
    return std::get<host::OpenCommand>(command.value());
}

std::string refusal(const Words& words)
{
    const auto command = host::parseCommandLine(words);
    return command ? "(accepted)" : command.error()->description();
}

TEST(CommandLine, NeedsNoMoreThanAMovie)
{
    const auto command = open({"open", "movie.mp4"});
    EXPECT_EQ(command.movie, "movie.mp4");
    EXPECT_THAT(command.appName, IsEmpty());
    EXPECT_THAT(command.bundleId, IsEmpty());
    EXPECT_EQ(command.message, std::nullopt);
    EXPECT_EQ(command.tint, std::nullopt);
    EXPECT_FALSE(command.json);
    EXPECT_THAT(command.editorArguments, IsEmpty());
}

TEST(CommandLine, TakesAllOptionsBeforeAndBehindTheMovie)
{
    const auto command =
        open({"open", "--app-name", "Racer", "--bundle-id=org.r", "--json", "m.webm", "--attachment", "notes.txt",
              "--message", "", "--tint=#FF8000", "--device", "pad", "--home-button=no", "--graphics-quality", "10"});
    EXPECT_EQ(command.movie, "m.webm");
    EXPECT_EQ(command.appName, "Racer");
    EXPECT_EQ(command.bundleId, "org.r");
    EXPECT_EQ(command.attachment, "notes.txt");
    EXPECT_EQ(command.message, "") << "an empty message is a message";
    EXPECT_EQ(command.tint, (platform::Color{1, 128 / 255.0, 0, 1}));
    EXPECT_TRUE(command.json);
    EXPECT_THAT(command.editorArguments,
                ElementsAre("--device", "pad", "--home-button", "no", "--graphics-quality", "10"));
}

TEST(CommandLine, TakesMoviesWithOddNames)
{
    EXPECT_EQ(open({"open", "--", "--json"}).movie, "--json");
    EXPECT_EQ(open({"open", "-"}).movie, "-");
    EXPECT_EQ(open({"open", "a=b"}).movie, "a=b");
    EXPECT_EQ(open({"open", "m", "--message", "--json"}).message, "--json") << "a value may look like an option";
    EXPECT_EQ(open({"open", "m", "--message=a=b"}).message, "a=b");
}

TEST(CommandLine, SaysWhichWordIsWrong)
{
    EXPECT_THAT(refusal({}), HasSubstr("say what to do"));
    EXPECT_THAT(refusal({"edit", "m"}), HasSubstr("no command edit"));
    EXPECT_THAT(refusal({"open"}), HasSubstr("needs a movie"));
    EXPECT_THAT(refusal({"open", ""}), HasSubstr("name is empty"));
    EXPECT_THAT(refusal({"open", "a", "b"}), HasSubstr("both a and b"));
    EXPECT_THAT(refusal({"open", "m", "--colour", "x"}), HasSubstr("no option --colour"));
    EXPECT_THAT(refusal({"open", "m", "-j"}), HasSubstr("no option -j"));
    EXPECT_THAT(refusal({"open", "m", "--tint"}), HasSubstr("--tint needs a value"));
    EXPECT_THAT(refusal({"open", "m", "--json=yes"}), HasSubstr("--json takes no value"));
    EXPECT_THAT(refusal({"service", "m"}), HasSubstr("service knows no m"));
    EXPECT_THAT(refusal({"service", "--idle-seconds", "-1"}), HasSubstr("--idle-seconds is a number"));
}

TEST(CommandLine, SaysWhatAValueShouldBe)
{
    for (const char* tint : {"red", "#12345", "#gggggg", "", "123456"})
        EXPECT_THAT(refusal({"open", "m", "--tint", tint}), HasSubstr("--tint is a colour")) << tint;
    EXPECT_THAT(refusal({"open", "m", "--device", "watch"}), HasSubstr("phone or pad, not \"watch\""));
    EXPECT_THAT(refusal({"open", "m", "--home-button", "maybe"}), HasSubstr("yes or no"));
    for (const char* quality : {"", "ten", "10x", "-1", "99999999999", "1.5"})
        EXPECT_THAT(refusal({"open", "m", "--graphics-quality", quality}), HasSubstr("is a number")) << quality;
    EXPECT_THAT(refusal({"open", "m", "--message", std::string(1024 * 1024 + 1, 'x')}), HasSubstr("longer than 1 MiB"));
    EXPECT_THAT(refusal({"open", "m", "--app-name", "\xFF\xFE"}), HasSubstr("not UTF-8"));
}

TEST(CommandLine, OnlyOneLineSaysWhatIsWrong)
{
    for (const Words& words : {Words{}, Words{"open"}, Words{"open", "m", "--tint", "x"}, Words{"nonsense"}})
        EXPECT_EQ(refusal(words).find('\n'), std::string::npos);
}

TEST(CommandLine, AsksForHelpAnywhere)
{
    for (const Words& words : {Words{"--help"}, Words{"-h"}, Words{"help"}, Words{"open", "--help"},
                               Words{"open", "m", "-h"}, Words{"service", "--help"}})
        EXPECT_TRUE(std::holds_alternative<host::HelpCommand>(host::parseCommandLine(words).value()));
    EXPECT_TRUE(std::holds_alternative<host::VersionCommand>(host::parseCommandLine({"--version"}).value()));
}

TEST(CommandLine, SetsHowLongTheServiceStays)
{
    const auto service = [](const Words& words) {
        return std::get<host::ServiceCommand>(host::parseCommandLine(words).value()).idle.count();
    };
    EXPECT_EQ(service({"service"}), 30);
    EXPECT_EQ(service({"service", "--idle-seconds", "5"}), 5);
    EXPECT_EQ(service({"service", "--idle-seconds=0"}), 0);
}

TEST(CommandLine, TakesEveryValueThatAnOptionCanHave)
{
    const auto arguments = [](const Words& words) { return open(words).editorArguments; };
    EXPECT_THAT(arguments({"open", "m", "--device=phone"}), ElementsAre("--device", "phone"));
    EXPECT_THAT(arguments({"open", "m", "--home-button", "yes"}), ElementsAre("--home-button", "yes"));
    EXPECT_THAT(arguments({"open", "m", "--graphics-quality", "0"}), ElementsAre("--graphics-quality", "0"));
    EXPECT_THAT(arguments({"open", "m", "--graphics-quality", "2147483647"}),
                ElementsAre("--graphics-quality", "2147483647"));
    EXPECT_THAT(refusal({"open", "m", "--graphics-quality", "2147483648"}), HasSubstr("is a number"));
    EXPECT_THAT(arguments({"open", "--verbose", "m"}), ElementsAre("--verbose"));
    EXPECT_THAT(refusal({"open", "m", "--verbose=yes"}), HasSubstr("--verbose takes no value"));
    EXPECT_EQ(open({"open", "m", "--message", std::string(1024 * 1024, 'x')}).message->size(), 1024U * 1024)
        << "as long as a text may be";
}

TEST(CommandLine, TakesATourOfAMovieIntoADirectory)
{
    const auto command = host::parseCommandLine({"tour", "m", "--output", "d", "--app-name", "Racer"});
    ASSERT_TRUE(command) << command.error()->description();
    const auto& tour = std::get<host::TourCommand>(command.value());
    EXPECT_EQ(tour.open.movie, "m");
    EXPECT_EQ(tour.open.appName, "Racer");
    EXPECT_EQ(tour.output, "d");
    EXPECT_EQ(refusal({"tour", "m", "--output=d"}), "(accepted)");
    EXPECT_THAT(refusal({"tour", "--output", "d"}), HasSubstr("tour needs a movie"));
    EXPECT_THAT(refusal({"tour", "m"}), HasSubstr("tour needs --output DIR"));
    EXPECT_THAT(refusal({"tour", "m", "--output"}), HasSubstr("--output needs a value"));
    EXPECT_THAT(refusal({"tour", "m", "--output", "d", "--json"}), HasSubstr("not --json"));
    EXPECT_THAT(refusal({"tour", "m", "--output", "d", "--tint", "red"}), HasSubstr("--tint is a colour"));
    EXPECT_THAT(refusal({"open", "m", "--output", "d"}), HasSubstr("no option --output"));
}

TEST(CommandLine, LeavesTheMediaCommandsToTheirOwn)
{
    EXPECT_TRUE(std::holds_alternative<host::MediaCommand>(host::parseCommandLine({"probe", "m"}).value()));
    for (const Words& words : {Words{"probe", "-h"}, Words{"tour", "-h"}, Words{"service", "-h"}})
        EXPECT_TRUE(std::holds_alternative<host::HelpCommand>(host::parseCommandLine(words).value()));
    EXPECT_THAT(refusal({"probe"}), HasSubstr("probe needs a movie"));
    EXPECT_THAT(refusal({"service", "--idle-seconds"}), HasSubstr("--idle-seconds needs a value"));
}

TEST(CommandLine, TakesNothingForAnOptionBehindTwoDashes)
{
    EXPECT_EQ(open({"open", "--json", "--", "--tint=red"}).movie, "--tint=red");
    EXPECT_EQ(open({"open", "m", "--"}).movie, "m");
    EXPECT_EQ(open({"open", "--", "--"}).movie, "--");
    EXPECT_THAT(refusal({"open", "--", "a", "-h"}), HasSubstr("both a and -h"));
}

} // namespace

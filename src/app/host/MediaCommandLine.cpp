#include "app/host/MediaCommandLine.h"

#include "app/host/Words.h"
#include "base/Text.h"

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <string_view>
#include <utility>

namespace host {

namespace {

constexpr int kMostThumbnails = 10'000;
constexpr int kLargestSide = 16'384; ///< pixels

base::Result<void> takeMovie(std::string& movie, const std::string& word)
{
    if (!movie.empty())
        return usageError("one movie at a time: both " + movie + " and " + word + " are given");
    if (word.empty())
        return usageError("the movie's name is empty");
    movie = word;
    return {};
}

base::Result<void> takeFlag(bool& flag, const Words& words)
{
    if (words.hasOwnValue())
        return usageError(words.word() + " takes no value");
    flag = true;
    return {};
}

base::Result<void> takeText(std::string& text, Words& words)
{
    const auto value = words.value();
    if (!value)
        return value.error();
    text = value.value();
    return {};
}

/// "320x180".
std::optional<base::Size> sizeIn(const std::string& text)
{
    const std::size_t cross = text.find('x');
    if (cross == std::string::npos)
        return std::nullopt;
    const auto width = wholeNumber(text.substr(0, cross));
    const auto height = wholeNumber(text.substr(cross + 1));
    if (!width || !height || *width < 1 || *height < 1 || *width > kLargestSide || *height > kLargestSide)
        return std::nullopt;
    return base::Size{double(*width), double(*height)};
}

/// What is written is an MP4 movie: under the name of another kind, programs that go by names would not play it.
base::Result<void> expectNameOfMp4(const std::string& command, const std::string& output)
{
    static constexpr std::string_view kOthers[] = {".3gp",  ".asf", ".avi", ".flv",  ".gif", ".h264", ".hevc",
                                                   ".m2ts", ".mka", ".mkv", ".mpeg", ".mpg", ".mts",  ".mxf",
                                                   ".ogg",  ".ogv", ".ts",  ".webm", ".wmv", ".y4m"};
    std::string extension = output.substr(std::min(output.rfind('.'), output.size()));
    std::transform(extension.begin(), extension.end(), extension.begin(), base::lowercase);
    if (std::find(std::begin(kOthers), std::end(kOthers), extension) == std::end(kOthers))
        return {};
    return usageError(command + " writes an MP4 movie, and " + output
                      + " is the name of another kind; let it end in .mp4");
}

base::Result<void> unknownOption(const std::string& command, const Words& words)
{
    return usageError(command + " has no option " + words.word());
}

// A command is read by an overload of each of these: takeOption takes the option that the words stand at, expectWhole
// says what is still missing at their end.

base::Result<void> takeOption(ThumbnailsCommand& command, Words& words)
{
    const std::string option = words.word();
    if (option == "--force")
        return takeFlag(command.force, words);
    if (option == "-o" || option == "--output")
        return takeText(command.output, words);
    if (option != "-n" && option != "--count" && option != "--size")
        return unknownOption("thumbnails", words);
    const auto value = words.value();
    if (!value)
        return value.error();
    if (option == "--size") {
        const auto size = sizeIn(value.value());
        if (!size)
            return usageError("--size is a width and a height like 320x180, not \"" + value.value() + "\"");
        command.size = *size;
        return {};
    }
    command.count = wholeNumber(value.value()).value_or(0);
    if (command.count < 1 || command.count > kMostThumbnails)
        return usageError(option + " is a number from 1 to " + std::to_string(kMostThumbnails) + ", not \""
                          + value.value() + "\"");
    return {};
}

base::Result<void> expectWhole(const ThumbnailsCommand& command)
{
    if (command.count == 0)
        return usageError("thumbnails needs -n N, how many");
    if (command.output.empty())
        return usageError("thumbnails needs -o DIR, for its pictures");
    return {};
}

base::Result<void> takeOption(TrimCommand& command, Words& words)
{
    const std::string option = words.word();
    if (option == "--force")
        return takeFlag(command.force, words);
    if (option == "-o" || option == "--output")
        return takeText(command.output, words);
    if (option != "--from" && option != "--to")
        return unknownOption("trim", words);
    const auto value = words.value();
    if (!value)
        return value.error();
    const auto moment = momentIn(value.value());
    if (!moment)
        return usageError(option + " is a time like 12.5, 1:30 or 01:02:03.25, not \"" + value.value() + "\"");
    (option == "--from" ? command.from : command.to.emplace()) = *moment;
    return {};
}

base::Result<void> expectWhole(const TrimCommand& command)
{
    if (command.output.empty())
        return usageError("trim needs -o OUT, for the new movie");
    if (const auto named = expectNameOfMp4("trim", command.output); !named)
        return named;
    if (command.to && !(*command.to > command.from))
        return usageError("--to must be behind --from");
    return {};
}

base::Result<void> takeOption(MixCommand& command, Words& words)
{
    if (words.word() == "--force")
        return takeFlag(command.force, words);
    if (words.word() == "-o" || words.word() == "--output")
        return takeText(command.output, words);
    return unknownOption("mix", words);
}

base::Result<void> expectWhole(const MixCommand& command)
{
    if (command.output.empty())
        return usageError("mix needs -o OUT, for the new movie");
    return expectNameOfMp4("mix", command.output);
}

base::Result<void> takeOption(ProbeCommand& command, Words& words)
{
    if (words.word() == "--json")
        return takeFlag(command.json, words);
    return unknownOption("probe", words);
}

base::Result<void> expectWhole(const ProbeCommand&)
{
    return {};
}

base::Result<void> takeOption(SaveCommand& command, Words& words)
{
    if (words.word() == "--app-name")
        return takeText(command.appName, words);
    return unknownOption("save", words);
}

base::Result<void> expectWhole(const SaveCommand&)
{
    return {};
}

base::Result<void> takeOption(ShareCommand& command, Words& words)
{
    if (words.word() == "--list")
        return takeFlag(command.list, words);
    if (words.word() == "--with")
        return takeText(command.with, words);
    if (words.word() == "--message")
        return takeText(command.message, words);
    return unknownOption("share", words);
}

base::Result<void> expectWhole(const ShareCommand& command)
{
    if (command.list == !command.with.empty())
        return usageError(command.list ? "share either lists (--list) or shares (--with TYPE)"
                                       : "say with what to share: --with TYPE; --list says what there is");
    return {};
}

/// `words` stand at the command's name.
template <typename Command> base::Result<std::optional<MediaCommand>> parse(const std::string& name, Words words)
{
    Command command;
    while (words.advance()) {
        if (words.isHelp())
            return std::optional<MediaCommand>();
        const auto taken = words.isOption() ? takeOption(command, words) : takeMovie(command.movie, words.word());
        if (!taken)
            return taken.error();
    }
    if (command.movie.empty())
        return usageError(name + " needs a movie");
    if (const auto whole = expectWhole(command); !whole)
        return whole.error();
    return std::optional<MediaCommand>(std::move(command));
}

struct Parser {
    const char* name;
    base::Result<std::optional<MediaCommand>> (*parse)(const std::string& name, Words words);
};

constexpr Parser kParsers[] = {
    {"trim", parse<TrimCommand>},   {"mix", parse<MixCommand>},   {"thumbnails", parse<ThumbnailsCommand>},
    {"probe", parse<ProbeCommand>}, {"save", parse<SaveCommand>}, {"share", parse<ShareCommand>}};

const Parser* parserOf(const std::string& name)
{
    for (const Parser& each : kParsers)
        if (name == each.name)
            return &each;
    return nullptr;
}

} // namespace

std::optional<base::MediaTime> momentIn(const std::string& text)
{
    constexpr std::size_t kMostParts = 3;
    constexpr std::int32_t kTicks = 1'000'000;
    const std::size_t point = text.find('.');
    std::string fraction = point == std::string::npos ? "0" : text.substr(point + 1);
    if (!std::all_of(fraction.begin(), fraction.end(), [](char each) { return each >= '0' && each <= '9'; }))
        return std::nullopt;
    fraction.resize(std::min<std::size_t>(fraction.size(), 6)); // finer than any movie's clock
    const auto ticks = wholeNumber(fraction);
    if (!ticks)
        return std::nullopt;
    std::int64_t value = *ticks;
    for (std::size_t digits = fraction.size(); digits < 6; ++digits)
        value *= 10;

    std::string whole = text.substr(0, point);
    std::int64_t unit = kTicks;
    for (std::size_t part = 1;; ++part) {
        const std::size_t colon = whole.rfind(':');
        const std::string last = colon == std::string::npos ? whole : whole.substr(colon + 1);
        const auto number = wholeNumber(last);
        if (!number || (colon != std::string::npos && *number >= 60))
            return std::nullopt;
        value += *number * unit;
        if (colon == std::string::npos)
            return base::MediaTime::make(value, kTicks);
        if (part == kMostParts)
            return std::nullopt;
        whole.resize(colon);
        unit *= 60;
    }
}

bool isMediaCommand(const std::string& name)
{
    return parserOf(name) != nullptr;
}

base::Result<std::optional<MediaCommand>> parseMediaCommand(const std::vector<std::string>& words)
{
    return parserOf(words.front())->parse(words.front(), Words(words, 1));
}

} // namespace host

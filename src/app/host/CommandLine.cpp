#include "app/host/CommandLine.h"

#include "app/host/Words.h"

#include <algorithm>
#include <iterator>

namespace host {

const char* const kHelpText = R"(Clipsa looks at, trims, saves and shares a screen recording.

  clipsa open MOVIE [OPTION…]   open MOVIE in the editor; print what was done with it, one activity a line
  clipsa service [--idle-seconds N]
                                serve recorders on the session bus, as org.clipsa.Clipsa
  clipsa tour MOVIE --output DIR [OPTION…]
                                open MOVIE without a screen, and leave a picture of each step in DIR
  clipsa trim MOVIE [--from T] [--to T] -o OUT [--force]
                                leave what MOVIE shows from one time up to another in OUT
  clipsa mix MOVIE -o OUT [--force]
                                leave MOVIE in OUT, with all of its sound tracks mixed into one
  clipsa thumbnails MOVIE -n N -o DIR [--size WxH] [--force]
                                leave N pictures of MOVIE, evenly spaced, in DIR
  clipsa probe MOVIE [--json]   say what MOVIE is made of
  clipsa save MOVIE [--app-name NAME]
                                mix the sound of MOVIE and put it into the library of videos
  clipsa share MOVIE --list | --with TYPE [--message TEXT]
                                say what MOVIE could be shared with, or share it
  clipsa --help, --version

Options of open, and of tour:
  --app-name NAME           the recorded app, as the title shows it (default: the file's name)
  --bundle-id ID            the recorded app's desktop or AppStream id
  --attachment FILE         a file to share along with the movie
  --message TEXT            the text to share, in place of the usual one
  --tint #RRGGBB            the colour of the top bar
  --device phone|pad        the layout (default: as the machine is)
  --home-button yes|no      whether the device has a home button
  --graphics-quality N      10 spares a slow device live blurs
  --json                    print one JSON object in place of lines
  --verbose                 say on standard error what the editor does

MOVIE is never changed: the editor gets a name of its own for it, or a copy.
Exit status: 0 done; 1 it could not be done; 2 a wrong option or file; 3 the editor ended early.
)";

const char* const kVersionText = "clipsa " CLIPSA_VERSION "\n";

namespace {

base::Result<void> takeEditorOption(OpenCommand& command, const std::string& option, const std::string& value)
{
    if (option == "--device" && value != "phone" && value != "pad")
        return usageError("--device is phone or pad, not \"" + value + "\"");
    if (option == "--home-button" && value != "yes" && value != "no")
        return usageError("--home-button is yes or no, not \"" + value + "\"");
    if (option == "--graphics-quality" && !wholeNumber(value))
        return usageError("--graphics-quality is a number from 0 up, not \"" + value + "\"");
    command.editorArguments.push_back(option);
    command.editorArguments.push_back(value);
    return {};
}

base::Result<void> takeOpenOption(OpenCommand& command, Words& words)
{
    const std::string option = words.word();
    if (option == "--json") {
        if (words.hasOwnValue())
            return usageError("--json takes no value");
        command.json = true;
        return {};
    }
    if (option == "--verbose") {
        if (words.hasOwnValue())
            return usageError("--verbose takes no value");
        command.editorArguments.push_back(option);
        return {};
    }
    static constexpr const char* kOptions[] = {"--app-name", "--bundle-id", "--attachment",  "--message",
                                               "--tint",     "--device",    "--home-button", "--graphics-quality"};
    if (std::find(std::begin(kOptions), std::end(kOptions), option) == std::end(kOptions))
        return usageError("there is no option " + option);
    const auto value = words.value();
    if (!value)
        return value.error();
    if (option == "--app-name") {
        command.appName = value.value();
    } else if (option == "--bundle-id") {
        command.bundleId = value.value();
    } else if (option == "--attachment") {
        command.attachment = value.value();
    } else if (option == "--message") {
        command.message = value.value();
    } else if (option == "--tint") {
        command.tint = platform::Color::fromHex(value.value());
        if (!command.tint)
            return usageError("--tint is a colour like #3584e4, not \"" + value.value() + "\"");
    } else {
        return takeEditorOption(command, option, value.value());
    }
    return {};
}

/// Nothing when the words ask for help.
base::Result<std::optional<TourCommand>> parseMovieCommand(Words words, bool isTour)
{
    TourCommand command;
    std::string& movie = command.open.movie;
    while (words.advance()) {
        if (words.isOption()) {
            if (words.isHelp())
                return std::optional<TourCommand>();
            if (isTour && words.word() == "--output") {
                const auto value = words.value();
                if (!value)
                    return value.error();
                command.output = value.value();
            } else if (const auto taken = takeOpenOption(command.open, words); !taken) {
                return taken.error();
            }
        } else if (!movie.empty()) {
            return usageError("one movie at a time: both " + movie + " and " + words.word() + " are given");
        } else if (words.word().empty()) {
            return usageError("the movie's name is empty");
        } else {
            movie = words.word();
        }
    }
    if (movie.empty())
        return usageError(isTour ? "tour needs a movie" : "open needs a movie");
    return std::optional(std::move(command));
}

base::Result<Command> parseOpen(Words words)
{
    auto command = parseMovieCommand(std::move(words), false);
    if (!command)
        return command.error();
    return command.value() ? Command(std::move(command.value()->open)) : Command(HelpCommand{});
}

base::Result<Command> parseTour(Words words)
{
    auto command = parseMovieCommand(std::move(words), true);
    if (!command)
        return command.error();
    if (!command.value())
        return Command(HelpCommand{});
    if (command.value()->output.empty())
        return usageError("tour needs --output DIR, for its pictures");
    if (command.value()->open.json)
        return usageError("tour prints a summary for people, not --json");
    return Command(std::move(*command.value()));
}

base::Result<Command> parseMedia(const std::vector<std::string>& words)
{
    auto command = parseMediaCommand(words);
    if (!command)
        return command.error();
    return command.value() ? Command(std::move(*command.value())) : Command(HelpCommand{});
}

base::Result<Command> parseService(Words words)
{
    ServiceCommand command;
    while (words.advance()) {
        if (words.word() == "--help" || words.word() == "-h")
            return Command(HelpCommand{});
        if (words.word() != "--idle-seconds")
            return usageError("service knows no " + words.word());
        const auto value = words.value();
        if (!value)
            return value.error();
        const auto seconds = wholeNumber(value.value());
        if (!seconds)
            return usageError("--idle-seconds is a number from 0 up, not \"" + value.value() + "\"");
        command.idle = std::chrono::seconds(*seconds);
    }
    return Command(command);
}

} // namespace

base::Result<Command> parseCommandLine(const std::vector<std::string>& words)
{
    if (words.empty())
        return usageError("say what to do, for example: clipsa open recording.mp4");
    const std::string& first = words.front();
    if (first == "--help" || first == "-h" || first == "help")
        return Command(HelpCommand{});
    if (first == "--version")
        return Command(VersionCommand{});
    if (first == "open")
        return parseOpen(Words(words, 1));
    if (first == "tour")
        return parseTour(Words(words, 1));
    if (first == "service")
        return parseService(Words(words, 1));
    if (isMediaCommand(first))
        return parseMedia(words);
    return usageError("there is no command " + first);
}

} // namespace host

// What `clipsa` becomes for the commands that need the media engine and no window; takes the same words.

#include "app/host/CommandLine.h"
#include "app/host/ExitStatus.h"
#include "app/host/MakeThumbnails.h"
#include "app/host/MixMovie.h"
#include "app/host/ProbeMovie.h"
#include "app/host/SaveMovie.h"
#include "app/host/ShareMovie.h"
#include "app/host/Streams.h"
#include "app/host/TrimMovie.h"

#include <cstdio>
#include <string>
#include <variant>
#include <vector>

namespace {

int run(const host::TrimCommand& command)
{
    return host::trimMovie(command);
}

int run(const host::MixCommand& command)
{
    return host::mixMovie(command);
}

int run(const host::ThumbnailsCommand& command)
{
    return host::makeThumbnails(command);
}

int run(const host::ProbeCommand& command)
{
    return host::probeMovie(command);
}

int run(const host::SaveCommand& command)
{
    return host::saveMovie(command);
}

int run(const host::ShareCommand& command)
{
    return host::shareMovie(command);
}

} // namespace

int main(int argc, char* argv[])
{
    host::keepStandardStreams();
    const auto command = host::parseCommandLine(std::vector<std::string>(argv + 1, argv + argc));
    if (!command) {
        host::complain(command.error()->description());
        return host::kExitUsage;
    }
    const auto* chosen = std::get_if<host::MediaCommand>(&command.value());
    if (!chosen) {
        std::fputs("clipsa-media: give this to clipsa\n", stderr);
        return host::kExitUsage;
    }
    return host::finishOutput(std::visit([](const auto& each) { return run(each); }, *chosen));
}

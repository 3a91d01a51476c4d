// The host's program: does what its command line says.

#include "app/host/CommandLine.h"
#include "app/host/OpenMovie.h"
#include "app/host/ServeRecorders.h"
#include "app/host/StartMediaProgram.h"
#include "app/host/Streams.h"
#include "app/host/TakeTour.h"

#include <QCoreApplication>

#include <cstdio>
#include <string>
#include <type_traits>
#include <vector>

namespace {

int run(const host::OpenCommand& command)
{
    return host::openMovie(command);
}

int run(const host::TourCommand& command)
{
    return host::takeTour(command);
}

int run(const host::ServiceCommand& command)
{
    return host::serveRecorders(command);
}

int run(const host::HelpCommand&)
{
    std::fputs(host::kHelpText, stdout);
    return host::kExitDone;
}

int run(const host::VersionCommand&)
{
    std::fputs(host::kVersionText, stdout);
    return host::kExitDone;
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
    const QCoreApplication application(argc, argv);
    return host::finishOutput(std::visit(
        [argv](const auto& chosen) {
            if constexpr (std::is_same_v<decltype(chosen), const host::MediaCommand&>)
                return host::startMediaProgram(argv);
            else
                return run(chosen);
        },
        command.value()));
}

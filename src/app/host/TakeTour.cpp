#include "app/host/TakeTour.h"

#include "app/host/OpenMovie.h"
#include "app/host/Streams.h"
#include "base/Environment.h"
#include "base/Text.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>
#include <string>
#include <system_error>
#include <unistd.h>
#include <utility>
#include <vector>

namespace host {

namespace {

namespace fs = std::filesystem;

constexpr const char* kReportName = "tour.txt";
constexpr const char* kScript = ":/clipsa/scripts/tour.script";

/// A runtime directory for an editor that would have none, gone with it.
class RuntimeDirectory {
public:
    RuntimeDirectory()
    {
        const std::string given = base::environment("XDG_RUNTIME_DIR");
        std::error_code error;
        if (!given.empty() && fs::is_directory(given, error))
            return;
        std::string path = (fs::temp_directory_path(error) / "clipsa-tour-XXXXXX").native();
        if (::mkdtemp(path.data()))
            m_path = path;
    }
    ~RuntimeDirectory()
    {
        std::error_code ignored;
        if (!m_path.empty())
            fs::remove_all(m_path, ignored);
    }
    RuntimeDirectory(const RuntimeDirectory&) = delete;
    RuntimeDirectory& operator=(const RuntimeDirectory&) = delete;

    /// Empty when the environment has one.
    const std::string& path() const { return m_path; }

private:
    std::string m_path;
};

/// A line of the script's report: what it is about, and what is said about it.
using ReportLine = std::pair<std::string, std::string>;

std::vector<ReportLine> readReport(const fs::path& file)
{
    std::vector<ReportLine> lines;
    std::ifstream stream(file);
    for (std::string line; std::getline(stream, line);) {
        const std::size_t space = line.find(' ');
        lines.emplace_back(line.substr(0, space), space == std::string::npos ? "" : line.substr(space + 1));
    }
    return lines;
}

void say(const std::string& what, const std::string& text)
{
    std::printf("%-10s%s\n", what.c_str(), base::printable(text).c_str());
}

/// False when a picture that was reported is not there.
bool sayPictures(const std::vector<ReportLine>& report, const fs::path& folder)
{
    bool all = true;
    say("Pictures", "in " + folder.native());
    for (const auto& [about, text] : report) {
        if (about != "picture")
            continue;
        const std::size_t space = text.find(' ');
        const std::string name = text.substr(0, space);
        std::error_code error;
        const bool isThere = !fs::is_empty(folder / name, error) && !error;
        all &= isThere;
        std::printf("  %-24s%s\n", name.c_str(), isThere ? text.substr(space + 1).c_str() : "is missing");
    }
    return all;
}

std::string words(const std::vector<std::string>& activityTypes)
{
    if (activityTypes.empty())
        return "told that the user has finished, without any activity";
    std::string text = "told that the user has finished, after";
    for (const std::string& type : activityTypes)
        text += " " + type;
    return text;
}

} // namespace

int takeTour(const TourCommand& command)
{
    std::error_code error;
    const fs::path folder = fs::absolute(command.output, error);
    if (!error)
        fs::create_directories(folder, error);
    if (!error)
        fs::remove(folder / kReportName, error);
    if (!error && ::access(folder.c_str(), W_OK) != 0)
        error = {errno, std::generic_category()};
    if (error) {
        complain(base::Error::fromErrno(error.value(), "cannot write pictures into " + command.output)->description());
        return kExitUsage;
    }

    const RuntimeDirectory runtime;
    std::optional<std::vector<std::string>> told;
    OpenVariation variation;
    variation.environment = {{"QT_QPA_PLATFORM", "offscreen"}, {"QT_QUICK_BACKEND", "software"},
                             {"QT_SCALE_FACTOR", "2"},         {"CLIPSA_SCRIPT", kScript},
                             {"CLIPSA_PICTURES", folder},      {"CLIPSA_REPORT", folder / kReportName}};
    if (!runtime.path().empty())
        variation.environment.emplace_back("XDG_RUNTIME_DIR", runtime.path());
    variation.finished = [&](const std::vector<std::string>& activityTypes) { told = activityTypes; };
    const int status = openMovie(command.open, std::move(variation));
    if (status == kExitUsage)
        return status;

    const auto report = readReport(folder / kReportName);
    say("Movie", fs::absolute(command.open.movie, error).native());
    bool finished = false;
    for (const auto& [about, text] : report) {
        finished |= about == "end";
        if (about != "end" && about != "picture")
            say(about, text);
    }
    const bool allPictures = sayPictures(report, folder);
    say("Host", told ? words(*told) : "not told that the user has finished");
    if (status != kExitDone)
        return status;
    return finished && allPictures && told ? kExitDone : kExitFailed;
}

} // namespace host

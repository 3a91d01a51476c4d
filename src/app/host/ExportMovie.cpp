#include "app/host/ExportMovie.h"

#include "app/host/ExitStatus.h"
#include "app/host/ProgressBar.h"
#include "linux/dbus/EditRequest.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

namespace fs = std::filesystem;

base::ErrorRef refused(const std::string& why)
{
    return base::Error::make(dbus::kBadInputDomain, EEXIST, why);
}

base::ErrorRef isThereAlready(const ExportOrder& order)
{
    return refused(order.output + " is there already; give --force to replace it");
}

/// With what can be done about it. `written` may stand in for the output.
base::ErrorRef explained(base::ErrorRef failure, const ExportOrder& order, const fs::path& written)
{
    std::string words = failure->description();
    const std::string name = written.filename().native();
    if (const std::size_t at = words.find(name); at != std::string::npos) {
        words.replace(at, name.size(), fs::path(order.output).filename().native());
        failure = base::Error::make(failure->domain(), failure->code(), words);
    }
    if (words.ends_with('.'))
        words.pop_back();
    switch (std::abs(failure->code())) { // the engine's numbers of the system's errors are negative
    case EEXIST:
        return isThereAlready(order);
    case ENOSPC:
    case EDQUOT:
    case EFBIG:
        return base::Error::make(failure->domain(), failure->code(),
                                 words + "; make room there, or choose another directory");
    default:
        return failure;
    }
}

/// Looked at before the movie, which takes longer. Null when there is nothing wrong with the directory.
base::ErrorRef whyNotInto(const fs::path& folder)
{
    std::error_code error;
    if (!fs::is_directory(folder, error))
        return refused("there is no directory " + folder.native() + "; make it first, or choose another");
    if (::access(folder.c_str(), W_OK | X_OK) != 0)
        return refused("nothing may be written into " + folder.native() + "; choose another directory");
    return nullptr;
}

/// A name beside a file, for what will take its place; nobody else has it.
fs::path nameBeside(const fs::path& path)
{
    std::random_device random;
    std::array<char, 32> name{};
    std::snprintf(name.data(), name.size(), ".clipsa-%08x%08x.new", random(), random());
    return path.parent_path() / name.data();
}

base::ErrorRef carryOut(MediaTool& tool, const ExportOrder& order)
{
    std::error_code error;
    const fs::path output = fs::absolute(order.output, error);
    if (base::ErrorRef why = whyNotInto(output.parent_path()))
        return why;
    const bool isThere = fs::exists(fs::symlink_status(output, error));
    if (isThere && !order.force)
        return isThereAlready(order);
    if (isThere && !fs::is_regular_file(output, error))
        return refused(order.output + " is not a file that could be replaced");
    if (fs::equivalent(order.movie, output, error))
        return refused(order.output + " is the movie itself, which is never changed");
    const auto asset = tool.open(order.movie);
    if (!asset)
        return asset.error();

    // A file that is replaced is there until the new one is whole.
    const fs::path written = order.force ? nameBeside(output) : output;
    const auto session = tool.media().exportSessionWithAsset(asset.value(), platform::ExportPreset::HighestQuality);
    session->setOutputURL(base::Url::fromPath(written.native()));
    order.setUp(*session, *asset.value());
    ProgressBar progress(order.doing);
    if (base::ErrorRef failure = tool.runExport(*session, [&] { progress.show(session->progress()); }))
        return explained(std::move(failure), order, written);
    if (order.force) {
        fs::rename(written, output, error);
        if (error) {
            std::error_code ignored;
            fs::remove(written, ignored);
            return base::Error::fromErrno(error.value(), "cannot replace " + order.output);
        }
    }
    return nullptr;
}

} // namespace

int exportMovie(const ExportOrder& order)
{
    MediaTool tool;
    const base::ErrorRef failure = carryOut(tool, order);
    tool.tellLog(base::MemoryLog::Line::Kind::Message);
    return failure ? tool.fail(failure) : kExitDone;
}

} // namespace host

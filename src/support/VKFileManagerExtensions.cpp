#include "support/VKFileManagerExtensions.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <string>
#include <utility>
#include <vector>

namespace VKExtensions {

namespace {

const base::System& systemOf(platform::FileManager& manager)
{
    return manager.system();
}

std::string pathOfEntry(platform::FileManager& manager, const std::string& name)
{
    return _srTempPath(manager) + "/" + name;
}

/// Whole seconds for "%i": what does not fit becomes the nearest that does, what is no number becomes 0.
std::int32_t truncated(double seconds)
{
    using Limits = std::numeric_limits<std::int32_t>;
    if (std::isnan(seconds))
        return 0;
    return static_cast<std::int32_t>(std::clamp<double>(seconds, Limits::min(), Limits::max()));
}

/// Two of the log's lines print this, the low half of the error's address, where the others print its code.
std::int32_t low32BitsOfReference(const base::ErrorRef& error)
{
    return static_cast<std::int32_t>(reinterpret_cast<std::uintptr_t>(error.get()));
}

/// The clean-up's one error: it stays set once something failed, and is reported again after every later step.
struct StickyError {
    base::Log& log;
    base::ErrorRef error;

    template <typename T> void take(const base::Result<T>& result)
    {
        if (!result)
            error = result.error();
        report();
    }

    void report() const
    {
        if (!error)
            return;
        log.error("error in _vqRemoveFile_srDeleteFilesOlderThanTimeToLiveInSeconds, error code: "
                  + std::to_string(error->code32()));
        log.console("error = " + error->description());
    }
};

} // namespace

std::string _srTempPath(platform::FileManager&)
{
    return VKScreenRecorderTempDirectory;
}

void _srSetupTempDirectory(platform::FileManager& receiver)
{
    base::Log& log = systemOf(receiver).log;
    log.message("_srSetupTempDirectory");
    const std::string path = _srTempPath(receiver);
    if (receiver.fileExists(path))
        return;
    if (const auto created = receiver.createDirectory(path); !created) {
        log.console("error: " + created.error()->description());
        log.error("error creating temp directory");
    }
}

std::int64_t _srSizeOfTempDir(platform::FileManager& receiver, base::ErrorRef* error)
{
    const auto attributes = receiver.defaultManager().attributesOfItem(_srTempPath(receiver));
    if (attributes)
        return attributes.value().size;
    if (error)
        *error = attributes.error();
    return 0;
}

std::int64_t _srDeleteAllTempFiles(platform::FileManager& receiver)
{
    return _srDeleteFilesOlderThanTimeToLiveInSeconds(receiver, 0.0);
}

std::int64_t _srDeleteFilesOlderThanTimeToLiveInSeconds(platform::FileManager& receiver, double timeToLive)
{
    const base::System& system = systemOf(receiver);
    system.log.message("_srDeleteFilesOlderThanTimeToLiveInSeconds: " + std::to_string(truncated(timeToLive)));

    StickyError sticky{system.log, nullptr};
    const auto names = receiver.defaultManager().contentsOfDirectory(_srTempPath(receiver));
    sticky.take(names);

    std::int64_t total = 0;
    for (const std::string& name : names.valueOr({})) {
        const std::string path = pathOfEntry(receiver, name);
        const auto attributes = receiver.attributesOfItem(path);
        sticky.take(attributes);

        // No number is older than nothing: comparisons with it fail, whatever the time to live.
        double age = std::numeric_limits<double>::quiet_NaN();
        if (attributes)
            age = system.clock.date().timeIntervalSince(attributes.value().modificationDate);
        if (timeToLive == 0.0 || age > timeToLive) {
            system.log.message("deleting old file");
            sticky.take(receiver.removeItem(path));
            // Without an error the attributes were read, too.
            if (!sticky.error)
                total += attributes.value().size;
        }
    }
    return total;
}

void _srRemoveFile_completion(platform::FileManager& receiver, const base::Url& url, FileCompletion completion)
{
    systemOf(receiver).backgroundQueue.post([&receiver, url, completion = std::move(completion)] {
        base::ErrorRef error;
        if (receiver.fileExists(url.path())) {
            error = receiver.removeItem(url.path()).error();
            if (error)
                systemOf(receiver).log.message("_vqRemoveFile error: " + std::to_string(error->code32()));
        }
        if (completion)
            completion(error);
    });
}

void _srMoveFileFromURL_toURL_completion(platform::FileManager& receiver, const base::Url& from, const base::Url& to,
                                         FileCompletion completion)
{
    systemOf(receiver).defaultQueue.post([&receiver, from, to, completion = std::move(completion)] {
        if (receiver.fileExists(to.path())) {
            // Its error tells nothing new: what could not be removed stands in the way of the move.
            static_cast<void>(receiver.removeItem(to.path()));
        }
        const base::ErrorRef error = receiver.moveItem(from.path(), to.path()).error();
        if (error)
            systemOf(receiver).log.error("_vqMoveFileFromURL error: " + std::to_string(low32BitsOfReference(error)));
        if (completion)
            completion(error);
    });
}

void _srDeleteFilesWithPrefix(platform::FileManager& receiver, const platform::StringFolding& folding,
                              const std::string& prefix)
{
    systemOf(receiver).defaultQueue.post([&receiver, &folding, prefix] {
        const auto names = receiver.defaultManager().contentsOfDirectory(_srTempPath(receiver));
        base::ErrorRef error = names.error();
        for (const std::string& name : names.valueOr({})) {
            if (!folding.hasPrefix(name, prefix))
                continue;
            // Logged here and not after the removal: the one before this is meant.
            if (error)
                systemOf(receiver).log.error("_vqDeleteFilesWithPrefix error: "
                                             + std::to_string(low32BitsOfReference(error)));
            if (const auto removed = receiver.removeItem(pathOfEntry(receiver, name)); !removed)
                error = removed.error();
        }
    });
}

std::optional<base::Date> _srGetCreationDateForFile(platform::FileManager& receiver, const base::Url& url)
{
    const auto attributes = receiver.defaultManager().attributesOfItem(url.path());
    if (!attributes)
        return std::nullopt;
    return attributes.value().creationDate;
}

bool _srDeviceHasSufficientFreeSpaceForRecording(platform::FileManager& receiver)
{
    return _srDeviceFreeDiskSpace(receiver) > VKScreenRecorderRequiredFreeSpace;
}

std::uint64_t _srDeviceFreeDiskSpace(platform::FileManager& receiver)
{
    return receiver.defaultManager().attributesOfFileSystem(_srTempPath(receiver)).valueOr({}).freeSize;
}

} // namespace VKExtensions

/// The temporary file store: every movie that the editor makes lives in one fixed directory, and goes with it.
///
/// What the system adds to the platform's file manager, the receiver first. No state of its own. All but the three
/// marked *worker* run at once, on the caller's thread, whichever that is. A worker task holds the receiver (and the
/// folding) by reference: both outlive everything, as the app that makes them does. Completions are called on the
/// worker, never on the main queue; an empty one is not called.
///
/// Nothing fails towards the caller but through completions and `error`: failures are logged and the work goes on.
/// Nothing is locked: of two clean-ups at once, the one that comes second to an entry logs an error.
#pragma once

#include "base/Date.h"
#include "base/Error.h"
#include "base/Url.h"
#include "platform/files/FileManager.h"
#include "platform/files/StringFolding.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

/// Where the movies live. The slash at its end is kept, so that full paths hold two.
inline constexpr const char* VKScreenRecorderTempDirectory = "/private/var/mobile/Library/Velkor/";

/// Bytes; recording needs more than this.
inline constexpr std::uint64_t VKScreenRecorderRequiredFreeSpace = 100'000'000;

namespace VKExtensions {

/// With the error of the one thing that was done, or null.
using FileCompletion = std::function<void(const base::ErrorRef& error)>;

std::string _srTempPath(platform::FileManager& receiver);

/// Makes the directory unless something is there. Its parent must be.
void _srSetupTempDirectory(platform::FileManager& receiver);

/// Bytes of the directory's own entry, not of what it holds; 0 with `error` set (if asked for) when that cannot be
/// read. Success leaves `error` alone.
std::int64_t _srSizeOfTempDir(platform::FileManager& receiver, base::ErrorRef* error);

/// Removes every entry, whatever made it and whenever; gives the bytes removed, as below.
std::int64_t _srDeleteAllTempFiles(platform::FileManager& receiver);

/// Removes entries older than `timeToLive` seconds, or all of them when it is exactly 0.
///
/// An age equal to `timeToLive` keeps its entry; so does a `timeToLive` that is not a number. An entry whose attributes
/// cannot be read is of unknown age and older than nothing: it is kept unless all go, and then counts 0 bytes.
/// Gives the bytes removed before the first failure of any kind; later removals happen but are not counted.
std::int64_t _srDeleteFilesOlderThanTimeToLiveInSeconds(platform::FileManager& receiver, double timeToLive);

/// *Worker, background priority.* Removes a file; that it is not there is success.
void _srRemoveFile_completion(platform::FileManager& receiver, const base::Url& url, FileCompletion completion);

/// *Worker, default priority.* Moves a file in place of whatever is at `to`, which is gone even if the move fails.
void _srMoveFileFromURL_toURL_completion(platform::FileManager& receiver, const base::Url& from, const base::Url& to,
                                         FileCompletion completion);

/// *Worker, default priority.* Removes the entries whose names begin with `prefix`, ignoring case and diacritics.
/// An error is logged when the next such entry is handled, so that of the last removal never is.
void _srDeleteFilesWithPrefix(platform::FileManager& receiver, const platform::StringFolding& folding,
                              const std::string& prefix);

/// Nothing when the file's attributes cannot be read.
std::optional<base::Date> _srGetCreationDateForFile(platform::FileManager& receiver, const base::Url& url);

/// More than `VKScreenRecorderRequiredFreeSpace` is free; exactly as much is not enough.
bool _srDeviceHasSufficientFreeSpaceForRecording(platform::FileManager& receiver);

/// Bytes free where the directory is; 0 when that cannot be read, as when there is no directory.
std::uint64_t _srDeviceFreeDiskSpace(platform::FileManager& receiver);

} // namespace VKExtensions

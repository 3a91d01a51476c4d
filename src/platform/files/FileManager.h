/// The file system as the system sees it. Any thread. Paths below the mounted device prefixes are resolved here, and
/// nowhere else.
#pragma once

#include "base/Date.h"
#include "base/Result.h"
#include "base/System.h"
#include "base/Url.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace platform {

struct FileAttributes {
    std::int64_t size = 0; ///< bytes, of the item itself
    base::Date modificationDate;
    base::Date creationDate;
    bool isDirectory = false;
};

struct FileSystemAttributes {
    std::uint64_t freeSize = 0; ///< bytes that a user without privileges can still write
};

class FileManager {
public:
    virtual ~FileManager() = default;

    /// The one that the process shares; itself, for that one.
    virtual FileManager& defaultManager() = 0;
    virtual const base::System& system() const = 0;

    /// Any kind of item; a dangling link does not exist.
    virtual bool fileExists(const std::string& path) = 0;
    /// Fails when its parent is not there.
    virtual base::Result<void> createDirectory(const std::string& path) = 0;
    /// Names, without "." and "..", in the file system's order.
    virtual base::Result<std::vector<std::string>> contentsOfDirectory(const std::string& path) = 0;
    /// Fails (EFBIG) when it has more than `mostBytes`, and when it is no regular file.
    virtual base::Result<std::string> contentsOfFile(const std::string& path, std::size_t mostBytes) = 0;
    /// Of the item itself: links are not followed.
    virtual base::Result<FileAttributes> attributesOfItem(const std::string& path) = 0;
    virtual base::Result<FileSystemAttributes> attributesOfFileSystem(const std::string& path) = 0;
    /// Directories go with all that they hold; links go, not what they point to.
    virtual base::Result<void> removeItem(const std::string& path) = 0;
    /// Fails when something exists at `to`.
    virtual base::Result<void> moveItem(const std::string& from, const std::string& to) = 0;
    /// The path that other programs know the item by.
    virtual std::string resolvedPath(const std::string& path) const = 0;
};

} // namespace platform

/// The directory that is the library, held open, and files on their way into it. Any thread, one at a time; they block.
///
/// A new file is invisible until it is whole, and goes when it gets no name, also when the process is killed: it has no
/// name at all where the file system can do that, and else a hidden one that the next publication sweeps.
#pragma once

#include "base/Result.h"
#include "linux/photos/LibraryName.h"
#include "linux/posix/FileDescriptor.h"

#include <ctime>
#include <string>

namespace photos {

class LibraryDirectory {
public:
    /// Makes the directory, and those above it, when it is not there.
    static base::Result<LibraryDirectory> open(const std::string& path);

    const std::string& path() const { return m_path; }
    int descriptor() const { return m_directory.get(); }

    /// Removes the hidden files of processes that died; those that somebody still writes stay.
    void sweep() const;
    /// Makes new and removed names last through a power cut.
    base::Result<void> flush() const;
    void remove(const std::string& name) const;

private:
    LibraryDirectory(std::string path, posix::FileDescriptor directory);

    std::string m_path;
    posix::FileDescriptor m_directory;
};

/// A file that is not in the library yet. `directory` outlives it.
class NewFile {
public:
    static base::Result<NewFile> make(const LibraryDirectory& directory);
    NewFile(NewFile&& other) noexcept = default;
    NewFile& operator=(NewFile&& other) = delete;
    ~NewFile();

    int descriptor() const { return m_file.get(); }

    /// Dates it and brings it to the disk. Once, after the last byte.
    base::Result<void> seal(const timespec& modified);

    /// Puts it into the library under the first number of `name` that is free, and gives the file's name; nothing that is
    /// there already is replaced. Once, after seal().
    base::Result<std::string> publish(const LibraryName& name);

private:
    NewFile(const LibraryDirectory& directory, posix::FileDescriptor file, std::string hiddenName);
    static base::Result<NewFile> makeHidden(const LibraryDirectory& directory);

    /// 0, or errno.
    int takeName(const std::string& name);
    /// For file systems where a file without a name cannot get one: goes on with a copy that has a hidden one.
    int becomeHidden();

    const LibraryDirectory* m_directory;
    posix::FileDescriptor m_file;
    std::string m_hiddenName; ///< empty: it has no name
};

} // namespace photos

/// The directory that is the library, held open. Any thread, one at a time; it blocks.
#pragma once

#include "base/Result.h"
#include "linux/photos/LibraryName.h"
#include "linux/posix/FileDescriptor.h"
#include "linux/posix/NewFile.h"

#include <string>

namespace photos {

class LibraryDirectory {
public:
    /// Makes the directory, and those above it, when it is not there.
    static base::Result<LibraryDirectory> open(const std::string& path);

    const std::string& path() const { return m_path; }
    int descriptor() const { return m_directory.get(); }

    /// Puts a file that was made in this directory, and sealed, into the library under the first number of `name` that is
    /// free, and gives the file's name; nothing that is there already is replaced.
    base::Result<std::string> publish(posix::NewFile& file, const LibraryName& name) const;
    /// Makes new and removed names last through a power cut.
    base::Result<void> flush() const;
    void remove(const std::string& name) const;

private:
    LibraryDirectory(std::string path, posix::FileDescriptor directory);

    std::string m_path;
    posix::FileDescriptor m_directory;
};

} // namespace photos

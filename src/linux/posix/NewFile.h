/// A file that gets its name when it is whole, and goes when it gets none, also when the process is killed. It has no name
/// at all while it is written, where the file system can do that, and else a hidden one, which the next sweep of its
/// directory removes. Any thread, one at a time; they block.
#pragma once

#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <ctime>
#include <string>
#include <sys/stat.h>

namespace posix {

/// Brings a file or a directory to the disk. 0, or errno.
int flush(int descriptor);

/// Removes the hidden files of processes that died while writing them; those that somebody still writes stay.
void sweepNewFiles(int directory);

class NewFile {
public:
    /// In the directory that `directory` is open on, as long as this lives. The code of the error is errno.
    static base::Result<NewFile> make(int directory);
    NewFile(NewFile&& other) noexcept = default;
    NewFile& operator=(NewFile&& other) = delete;
    ~NewFile();

    /// For reading and writing.
    int descriptor() const { return m_file.get(); }
    /// Whether it has a hidden name. Whoever makes such files sweeps, as they outlive a killed process.
    bool isHidden() const { return !m_hiddenName.empty(); }

    /// Lets nobody read it who may not read a file with these permissions, which it was made from. 0, or errno.
    int keepAsPrivateAs(mode_t permissions);

    /// Dates it, unless told to leave that out, and brings it to the disk. Once, after the last byte.
    base::Result<void> seal(const timespec& modified = {0, UTIME_OMIT});

    /// Gives it its name; nothing that has that name already is replaced. After seal(); again after an error. 0, or errno.
    int takeName(const std::string& name);
    /// The same, in the place of what has that name; there is a whole file of that name all the time. 0, or errno.
    int replace(const std::string& name);

private:
    NewFile(int directory, FileDescriptor file, std::string hiddenName);
    static base::Result<NewFile> makeHidden(int directory);
    int tryName(const std::string& name) const;
    /// For file systems where a file without a name cannot get one: goes on with a copy that has a hidden one.
    int becomeHidden();

    int m_directory;
    FileDescriptor m_file;
    std::string m_hiddenName; ///< empty: it has no name, or its own
};

} // namespace posix

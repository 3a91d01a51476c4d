/// A file that gets its name when it is whole, and leaves nothing behind when it does not. One thread.
///
/// It has no name at all while it is written, where the file system knows such files; else a hidden one beside its own.
#pragma once

#include "base/Result.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

namespace ffmpeg {

class OutputFile {
public:
    /// Fails when there is something of that name already.
    static base::Result<std::unique_ptr<OutputFile>> create(const std::string& path);
    /// Removes what was not published.
    ~OutputFile();
    OutputFile(const OutputFile&) = delete;
    OutputFile& operator=(const OutputFile&) = delete;

    /// The last component of the path, for messages.
    const std::string& name() const { return m_name; }
    int descriptor() const { return m_descriptor; }

    /// All of it, or a negative errno. Past the end is fine.
    int write(std::int64_t position, const std::uint8_t* bytes, std::size_t count);
    /// Starts over.
    base::Result<void> clear();
    /// Brings it to the disk, then under its name. Never in place of another file.
    base::Result<void> publish();

private:
    OutputFile(int directory, std::string name) : m_directory(directory), m_name(std::move(name)) {}
    base::ErrorRef failure(int error) const;
    int link() const;

    int m_directory;
    std::string m_name;
    std::string m_hiddenName; ///< empty when it has none
    int m_descriptor = -1;
    bool m_published = false;
};

} // namespace ffmpeg

/// The file that an export writes: it gets its name when it is whole, and leaves nothing behind when it does not. One
/// thread.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/OpenFile.h"
#include "linux/posix/NewFile.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

namespace ffmpeg {

class OutputFile {
public:
    /// Fails when there is something of that name already. But `source`, where it is not null, may be about to be removed
    /// from there: publish() gives that some time. Nobody may read the file who may not read `source`.
    static base::Result<std::unique_ptr<OutputFile>> create(const std::string& path,
                                                            std::shared_ptr<const OpenFile> source = nullptr);
    OutputFile(const OutputFile&) = delete;
    OutputFile& operator=(const OutputFile&) = delete;

    /// The last component of the path, for messages.
    const std::string& name() const
    {
        m_affinity.assertHere();
        return m_name;
    }
    int descriptor() const
    {
        m_affinity.assertHere();
        return m_file->descriptor();
    }

    /// All of it, or a negative errno. Past the end is fine. From time to time the disk is given what was written.
    int write(std::int64_t position, const std::uint8_t* bytes, std::size_t count);
    /// Gives the disk all that was written, for publish() to have less to wait for; does not wait itself.
    void sendToDisk();
    /// Starts over.
    base::Result<void> clear();
    /// Brings it to the disk, then under its name. Never in place of another file.
    base::Result<void> publish();

private:
    OutputFile(std::string path, std::shared_ptr<const OpenFile> source);
    bool isTaken() const;
    base::ErrorRef failure(int error) const;
    void sendToDisk(std::int64_t until);

    base::Affinity m_affinity;
    std::string m_path;
    std::shared_ptr<const OpenFile> m_source;
    std::string m_name;
    posix::FileDescriptor m_directory;
    std::optional<posix::NewFile> m_file; ///< there as soon as create() has done its work
    std::int64_t m_onItsWay = 0;          ///< up to here the disk was given it
};

} // namespace ffmpeg

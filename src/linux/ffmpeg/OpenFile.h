/// A movie's file, opened once and held open: it stays readable after it was removed. Any thread.
#pragma once

#include "base/Result.h"

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <sys/stat.h>

namespace ffmpeg {

class OpenFile {
public:
    /// Regular files only: anything else could block, or never end.
    static base::Result<std::shared_ptr<OpenFile>> open(const std::string& path);
    /// A file that is open already; `descriptor` stays the caller's.
    static base::Result<std::shared_ptr<OpenFile>> of(int descriptor, const std::string& name);
    ~OpenFile();
    OpenFile(const OpenFile&) = delete;
    OpenFile& operator=(const OpenFile&) = delete;

    /// The last component of the path, for messages.
    const std::string& name() const { return m_name; }
    std::int64_t size() const;
    /// Who may read and write it.
    mode_t permissions() const { return m_permissions; }
    /// Bytes read, 0 at the end, or a negative errno. Readers do not share a position.
    std::int64_t read(std::int64_t position, std::uint8_t* into, std::size_t count) const;
    /// How many reads have failed so far. Demuxers take a place that cannot be read for the end of the file: who needs
    /// all of it asks before and afterwards.
    int failedReads() const { return m_failedReads; }
    /// Whether somebody has written to it since it was opened.
    bool hasChanged() const;
    /// Whether `path` leads to this very file as it was when it was opened, or leads nowhere any more.
    bool isStillAt(const std::string& path) const;

private:
    /// What changes when another file, or other content, takes its place.
    struct Identity {
        std::uint64_t device, inode;
        std::int64_t size, seconds, nanoseconds;
        bool operator==(const Identity&) const = default;
    };

    OpenFile(int descriptor, std::string name) : m_descriptor(descriptor), m_name(std::move(name)) {}
    static Identity identityOf(const struct stat& about);

    int m_descriptor;
    std::string m_name;
    mode_t m_permissions = S_IRUSR | S_IWUSR;
    Identity m_identity{};
    mutable std::atomic<int> m_failedReads = 0;
};

} // namespace ffmpeg

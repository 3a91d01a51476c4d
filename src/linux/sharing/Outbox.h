/// Where files lie that were given to other programs: they read them later, perhaps when we have gone.
///
/// Each file has a directory of its own below the outbox, under the name that its receiver will see. It is kept while
/// somebody holds it, in whatever process, and for a day. Any thread; putting a file there takes its time.
#pragma once

#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace sharing {

class Outbox {
public:
    static constexpr std::chrono::hours kLifetime{24};
    /// Bytes; what a mail's header and an encrypted home directory take.
    static constexpr std::size_t kLongestName = 120;

    /// What its receiver does with a file.
    enum class Use {
        Read,  ///< nothing else: it may share its bytes with the file that it was made from
        Change ///< perhaps: nobody else has its bytes
    };

    /// A file in the outbox, kept while this lives.
    class File {
    public:
        File(std::string path, posix::FileDescriptor lock) : m_path(std::move(path)), m_lock(std::move(lock)) {}

        const std::string& path() const { return m_path; }
        /// What a receiver gets that may not write; nothing, with errno, when it cannot be opened.
        posix::FileDescriptor openForReading() const;

    private:
        std::string m_path;
        posix::FileDescriptor m_lock;
    };
    /// Is told of each step of a copy; false stops it.
    using Progress = std::function<bool(std::uint64_t copied, std::uint64_t total)>;

    /// `root` is made when it is needed, for the user alone.
    explicit Outbox(std::string root) : m_root(std::move(root)) {}
    /// In the user's cache directory. Asked before there are threads.
    static base::Result<Outbox> ofUser();

    /// Puts the file at `path` there as `name`: as a reflink, a hard link where it is only read, or a copy, whichever works
    /// first. `name` is made into one that every file system takes. After an error, or a stop (ECANCELED), nothing is left
    /// of it. The error carries a message for people that says what to do. Sweeps first, which makes room.
    base::Result<std::shared_ptr<const File>> put(const std::string& path, const std::string& name,
                                                  const Progress& goOn = {}, Use use = Use::Read) const;
    /// Removes what is older than a day and held by nobody, and what nobody finished.
    void sweep() const;

private:
    std::string m_root;
};

} // namespace sharing

/// One change of the library: takes hold of the movies that are asked for, then puts all of them into the library, or
/// none. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/photos/LibraryDirectory.h"
#include "linux/photos/VideoLibrary.h"
#include "linux/posix/FileDescriptor.h"

#include <cstdint>
#include <string>
#include <vector>

namespace photos {

class VideoLibrary::Transaction final : public platform::PhotoLibraryChange {
public:
    Transaction(const LibraryOptions& options, base::Work& work) : m_options(options), m_work(work) {}

    /// Opens the movie at once: it may lose its name before it is copied.
    void createAssetFromVideoAtFileURL(const std::optional<base::Url>& url) override;

    /// Gives the paths of the new files. Once, after the change block.
    base::Result<std::vector<std::string>> commit();
    /// After a commit() that failed: keeps each movie where the options say; gives the paths, or why one is nowhere.
    std::vector<base::Result<std::string>> keepUnsaved() const;

private:
    struct Source {
        std::string path;
        posix::FileDescriptor file;
        mode_t permissions = 0;
        std::uint64_t size = 0; ///< bytes
        base::Date date;        ///< of the recording
        LibraryName name;
    };

    base::Result<Source> open(const std::optional<base::Url>& url) const;
    base::Result<posix::NewFile> copy(const Source& source, const LibraryDirectory& directory, double done) const;
    base::ErrorRef explained(const base::ErrorRef& error, const Source& source) const;

    base::Affinity m_affinity;
    const LibraryOptions& m_options;
    base::Work& m_work;
    std::vector<Source> m_sources;
    base::ErrorRef m_error; ///< the first
};

} // namespace photos

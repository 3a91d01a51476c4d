/// The private directory of one editor, `editor-XXXXXX` below a root: what the editor is given lies in it, and it goes
/// with the editor. A lock says that somebody lives in it. Any thread.
#pragma once

#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <string>

namespace host {

/// The system's path of the directory that a movie is handed over in, as the editor knows it.
inline constexpr const char* kDeviceMovieDirectory = "/private/var/mobile/Library/Velkor/";

/// "$XDG_CACHE_HOME/clipsa", or ".cache/clipsa" in the home directory; an error when there is neither.
base::Result<std::string> editorDirectoriesRoot();

/// Removes the directories of editors that are dead, and counts them. Keeps what is not an editor's directory, follows
/// no link, and leaves what it may not remove.
int sweepEditorDirectories(const std::string& root);

class EditorDirectory {
public:
    /// Makes one that nobody else may enter, with its lock held.
    static base::Result<EditorDirectory> make(const std::string& root);

    EditorDirectory(EditorDirectory&&) noexcept = default;
    EditorDirectory& operator=(EditorDirectory&&) = delete;
    /// Removes the directory and all in it.
    ~EditorDirectory();

    const std::string& path() const { return m_path; }
    /// Stands for the directory "/private/var/mobile/Library".
    std::string deviceRoot() const { return m_path + "/private"; }
    std::string movieDirectory() const { return deviceRoot() + "/Velkor"; }
    /// For an attachment that was not given by its path; not there at first.
    std::string attachmentDirectory() const { return m_path + "/attachment"; }
    /// A path for a socket that nobody else reaches: in the directory, or, where that is too long, in the user's
    /// runtime directory, or else in a directory of its own among the temporary files, which is made now. All of it goes
    /// with the directory. Once.
    base::Result<std::string> socketPath() const;
    /// Whoever inherits it keeps the directory alive.
    int lock() const { return m_lock.get(); }

private:
    EditorDirectory(std::string path, posix::FileDescriptor lock);

    std::string m_path; // empty when moved away
    posix::FileDescriptor m_lock;
};

} // namespace host

/// What an editor tells its host about movies, whenever it comes to it: also when the connection has been closed since,
/// when the disk is full, or just before a crash. It is kept in memory that both processes have open; the editor adds
/// to it, on any thread, and the host reads it.
#pragma once

#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <string>
#include <utility>
#include <vector>

namespace dbus {

/// The number under which an extension finds it among its open files when it is told so by `--report`.
inline constexpr int kEditorReportDescriptor = 4;

struct MovieNote {
    enum class Kind {
        Saved,   ///< it was put into the library
        Unsaved, ///< it was to be, and could not
        Refused, ///< it is what was handed over, and is no movie
    } kind;
    std::string path; ///< where it is; empty when it is nowhere
    std::string why;  ///< it was not saved, or refused
};

class EditorReport {
public:
    /// For a host: an empty one.
    static base::Result<EditorReport> make();
    /// For an editor: the one that it was given.
    explicit EditorReport(posix::FileDescriptor file) : m_file(std::move(file)) {}

    int descriptor() const { return m_file.get(); }

    void add(const MovieNote& note);
    /// All that has been added so far, in order.
    std::vector<MovieNote> notes() const;

private:
    posix::FileDescriptor m_file;
};

} // namespace dbus

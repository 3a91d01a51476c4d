/// What an editor tells its host about movies, whenever it comes to it: also when the connection has been closed since,
/// when the disk is full, or just before a crash. It is kept in memory that both processes have open; the editor adds
/// to it, on any thread, and the host reads it.
#pragma once

#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace dbus {

/// The number under which an extension finds it among its open files when it is told so by `--report`.
inline constexpr int kEditorReportDescriptor = 4;

/// What became of a movie. Name the members that a kind has, `{.kind = Kind::Shared, .type = …, .receiver = …}`.
struct MovieNote {
    enum class Kind {
        Saved,    ///< it was put into the library, at `path`
        Unsaved,  ///< it was to be, and could not, for the reason `why`; `path` is where it is kept
        Refused,  ///< it is what was handed over, and is no movie, as `why` says
        Shared,   ///< the activity `type` is completed: `receiver` has it
        Unshared, ///< the activity `type` was to give it to `receiver`, and could not, for the reason `why`
    } kind;
    std::string path = {};     ///< empty when it is nowhere
    std::string why = {};      ///< in English, for logs
    std::string type = {};     ///< one line
    std::string receiver = {}; ///< a device's name, or the path of what was made; empty when it is not known
};

class EditorReport {
public:
    static constexpr std::size_t kLongestText = 4096;

    /// For a host: an empty one.
    static base::Result<EditorReport> make();
    /// For an editor: the one that it was given.
    explicit EditorReport(posix::FileDescriptor file) : m_file(std::move(file)) {}

    int descriptor() const { return m_file.get(); }

    /// A text ends before a zero byte, and after kLongestText bytes at most, between two characters.
    void add(const MovieNote& note);
    /// All that has been added so far, in order.
    std::vector<MovieNote> notes() const;

private:
    posix::FileDescriptor m_file;
};

} // namespace dbus

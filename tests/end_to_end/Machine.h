/// A machine of a test's own: a home, a cache, a runtime directory, movies, and the real `clipsa` in it.
#pragma once

#include "support/Child.h"
#include "support/Paths.h"
#include "support/PrivateDirectory.h"

#include <filesystem>
#include <map>
#include <string>
#include <vector>

namespace tests {

class Machine {
public:
    using Words = std::vector<std::string>;

    Machine();

    /// A copy of a test movie, or of any file; made on 2024-05-17 at 09:30 UTC.
    std::filesystem::path movie(const std::string& name) const;
    std::filesystem::path movieFrom(const std::filesystem::path& source) const;
    /// A file of this machine's user with this text in it.
    std::filesystem::path write(const std::string& name, const std::string& text) const;

    /// Set for the next programs, in place of what is there.
    void set(const std::string& name, const std::string& value) { m_environment[name] = value; }
    void setScale(int scale) { set("QT_SCALE_FACTOR", std::to_string(scale)); }
    /// What is done to the next editors; see Script.h.
    void setScript(const std::string& script);
    /// What scripts print goes to report(), instead of the host's standard error.
    void keepReport();

    /// Starts `clipsa` with these words; `movie` first when it is `open`.
    Child start(const Words& words) const;
    Child::End run(const Words& words) const { return start(words).wait(); }
    Child::End open(const std::filesystem::path& movie, const Words& options = {}) const;
    std::vector<std::string> environment() const;

    /// The lines that scripts have printed.
    std::vector<std::string> report() const;
    std::filesystem::path picture(const std::string& name) const { return m_directory.path() / "pictures" / name; }
    std::filesystem::path home() const { return m_directory.path() / "home"; }

    /// The directories of editors, living or left behind.
    std::vector<std::filesystem::path> editorDirectories() const;
    /// Where lies what was given to other programs.
    std::filesystem::path outbox() const;
    /// Processes of that name in this machine; all of them when it is empty.
    std::vector<pid_t> processes(const std::string& name = {}) const;
    /// What is left of programs that have ended: names of files and processes, for messages. Empty when all is well.
    std::string remains() const;

private:
    PrivateDirectory m_directory;
    std::map<std::string, std::string> m_environment;
};

} // namespace tests

#include "end_to_end/Machine.h"

#include <fcntl.h>
#include <sstream>
#include <sys/stat.h>

extern char** environ;

namespace tests {

namespace fs = std::filesystem;

namespace {

constexpr time_t kRecorded = 1715938200; // 2024-05-17 09:30 UTC

std::string fileText(const fs::path& path)
{
    return PrivateDirectory::read(path);
}

bool isAbout(const std::string& entry, const char* start)
{
    return entry.rfind(start, 0) == 0;
}

} // namespace

Machine::Machine()
{
    const fs::path root = m_directory.path();
    for (const char* folder : {"home", "cache", "runtime", "temporary", "movies", "pictures"})
        fs::create_directory(root / folder);
    fs::permissions(root / "runtime", fs::perms::owner_all);
    m_environment = {{"HOME", home()},
                     {"XDG_CACHE_HOME", root / "cache"},
                     {"XDG_RUNTIME_DIR", root / "runtime"},
                     {"TMPDIR", root / "temporary"},
                     {"CLIPSA_PICTURES", root / "pictures"},
                     {"LC_ALL", "C.UTF-8"},
                     {"TZ", "UTC"},
                     {"QT_QPA_PLATFORM", "offscreen"},
                     {"QT_QUICK_BACKEND", "software"}};
    // How sanitizers report, and where programs are, is the developer's choice.
    for (char** entry = environ; *entry; ++entry) {
        const std::string text = *entry;
        const std::size_t equals = text.find('=');
        if (isAbout(text, "PATH=") || text.substr(0, equals).find("SAN_OPTIONS") != std::string::npos)
            m_environment[text.substr(0, equals)] = text.substr(equals + 1);
    }
}

fs::path Machine::movie(const std::string& name) const
{
    return movieFrom(tests::movie(name));
}

fs::path Machine::movieFrom(const fs::path& source) const
{
    const fs::path copy = m_directory.path() / "movies" / source.filename();
    fs::copy_file(source, copy, fs::copy_options::overwrite_existing);
    const timespec times[2] = {{kRecorded, 0}, {kRecorded, 0}};
    ::utimensat(AT_FDCWD, copy.c_str(), times, 0);
    return copy;
}

fs::path Machine::write(const std::string& name, const std::string& text) const
{
    return m_directory.write(name, text);
}

void Machine::setScript(const std::string& script)
{
    set("CLIPSA_SCRIPT", write("script", script));
}

void Machine::keepReport()
{
    set("CLIPSA_REPORT", m_directory.path() / "report");
}

Child Machine::start(const Words& words) const
{
    Words arguments = {program("clipsa")};
    arguments.insert(arguments.end(), words.begin(), words.end());
    return Child(arguments, environment());
}

Child::End Machine::open(const fs::path& movie, const Words& options) const
{
    Words words = {"open", movie};
    words.insert(words.end(), options.begin(), options.end());
    return run(words);
}

std::vector<std::string> Machine::environment() const
{
    std::vector<std::string> entries;
    for (const auto& [name, value] : m_environment)
        entries.push_back(name + "=" + value);
    return entries;
}

std::vector<std::string> Machine::report() const
{
    std::istringstream text(fileText(m_directory.path() / "report"));
    std::vector<std::string> lines;
    for (std::string line; std::getline(text, line);)
        lines.push_back(line);
    return lines;
}

std::vector<fs::path> Machine::editorDirectories() const
{
    std::vector<fs::path> found;
    std::error_code error;
    for (const auto& entry : fs::directory_iterator(m_directory.path() / "cache/clipsa", error))
        if (entry.path() != outbox())
            found.push_back(entry.path());
    return found;
}

fs::path Machine::outbox() const
{
    return m_directory.path() / "cache/clipsa/outbox";
}

std::vector<pid_t> Machine::processes(const std::string& name) const
{
    // Programs inherit the environment of the one that started them.
    const std::string mark = '\0' + std::string("HOME=") + home().native() + '\0';
    std::vector<pid_t> found;
    for (const auto& entry : fs::directory_iterator("/proc")) {
        const std::string number = entry.path().filename();
        if (number.find_first_not_of("0123456789") != std::string::npos)
            continue;
        const bool isOurs = ('\0' + fileText(entry.path() / "environ")).find(mark) != std::string::npos;
        if (isOurs && (name.empty() || fileText(entry.path() / "comm") == name + "\n"))
            found.push_back(static_cast<pid_t>(std::stol(number)));
    }
    return found;
}

std::string Machine::remains() const
{
    std::string text;
    for (const pid_t process : processes())
        text += "process " + fileText("/proc/" + std::to_string(process) + "/comm");
    for (const auto& directory : editorDirectories())
        text += directory.native() + "\n";
    // Others keep things there for as long as a session lasts: the sound server's library does.
    for (const char* folder : {"runtime", "temporary"})
        for (const auto& entry : fs::directory_iterator(m_directory.path() / folder))
            if (isAbout(entry.path().filename(), "clipsa"))
                text += entry.path().native() + "\n";
    return text;
}

} // namespace tests

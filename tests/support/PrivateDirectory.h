/// A directory of one test's own, gone with it. Any thread.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>

namespace tests {

class PrivateDirectory {
public:
    /// Below `parent`, which chooses the file system.
    explicit PrivateDirectory(const std::filesystem::path& parent = std::filesystem::temp_directory_path())
    {
        std::string name = (parent / "clipsa-test-XXXXXX").native();
        if (!::mkdtemp(name.data()))
            throw std::runtime_error("no private directory in " + parent.native());
        m_path = name;
    }
    ~PrivateDirectory()
    {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }
    PrivateDirectory(const PrivateDirectory&) = delete;
    PrivateDirectory& operator=(const PrivateDirectory&) = delete;

    const std::filesystem::path& path() const { return m_path; }

    /// Writes a file and gives its path; the directories above it are made.
    std::filesystem::path write(const std::filesystem::path& relative, const std::string& contents) const
    {
        std::filesystem::path file = m_path / relative;
        std::filesystem::create_directories(file.parent_path());
        std::ofstream(file, std::ios::binary) << contents;
        return file;
    }

    static std::string read(const std::filesystem::path& file)
    {
        std::ifstream stream(file, std::ios::binary);
        return {std::istreambuf_iterator<char>(stream), {}};
    }

private:
    std::filesystem::path m_path;
};

} // namespace tests

/// The files of this machine, the device's fixed paths included. Any thread: it keeps nothing but the mounts.
///
/// Creation dates are the earlier of birth and last modification: a copy or a link that keeps the recording's
/// modification date keeps its age, though its own file was born later. Errors carry `errno` as their code and name the
/// path as the caller wrote it.
#pragma once

#include "linux/xdg/MountTable.h"
#include "platform/files/FileManager.h"

namespace xdg {

class FileManager final : public platform::FileManager {
public:
    /// `system` outlives this.
    FileManager(const base::System& system, MountTable mounts);

    platform::FileManager& defaultManager() override { return *this; }
    const base::System& system() const override { return m_system; }

    bool fileExists(const std::string& path) override;
    base::Result<void> createDirectory(const std::string& path) override;
    base::Result<std::vector<std::string>> contentsOfDirectory(const std::string& path) override;
    base::Result<std::string> contentsOfFile(const std::string& path, std::size_t mostBytes) override;
    base::Result<platform::FileAttributes> attributesOfItem(const std::string& path) override;
    base::Result<platform::FileSystemAttributes> attributesOfFileSystem(const std::string& path) override;
    /// Roots of mounts are busy and stay.
    base::Result<void> removeItem(const std::string& path) override;
    /// Across file systems the item is copied beside its destination, appears there at once and whole, and then goes
    /// from its source; when that last step fails, both are left.
    base::Result<void> moveItem(const std::string& from, const std::string& to) override;
    std::string resolvedPath(const std::string& path) const override;

private:
    const base::System& m_system;
    const MountTable m_mounts;
};

} // namespace xdg

/// Where the device's fixed paths really are: whole prefixes, mounted on directories of this machine.
///
/// Immutable once filled; then any thread. Of nested mounts the longest counts. Prefixes match whole components, however
/// many slashes stand between them. Within a mount "." and ".." are resolved by name, and ".." stops at its root, as at
/// the root of any file system. Paths outside the mounts are left alone to the last byte.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace xdg {

/// The two prefixes that the system's fixed paths begin with.
inline constexpr const char* kPrivateLibraryPrefix = "/private/var/mobile/Library";
inline constexpr const char* kSystemLibraryPrefix = "/System/Library";

class MountTable {
public:
    /// Both absolute; `prefix` without "." and "..". A prefix that is already mounted is mounted anew.
    void mount(std::string_view prefix, std::string directory);

    /// The path on this machine. Empty, which no item is called, when `path` holds a zero byte: the operating system
    /// would take it for a shorter one.
    std::string resolved(std::string_view path) const;

    /// Whether `path` is the root of a mount, or of the machine: those cannot be removed.
    bool isRoot(std::string_view path) const;

private:
    using Components = std::vector<std::string>;
    struct Mount {
        Components prefix;
        std::string directory;
    };

    Components lexicallyResolved(std::string_view path) const;
    const Mount* longestMountOf(const Components& components) const;
    bool isMountRoot(const Components& components) const;

    std::vector<Mount> m_mounts;
};

} // namespace xdg

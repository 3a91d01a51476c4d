#include "linux/dbus/Asker.h"

#include <array>
#include <cerrno>
#include <cstddef>
#include <fcntl.h>
#include <optional>
#include <sys/stat.h>

namespace dbus {

namespace {

/// More than any of the files that are read here has.
constexpr std::size_t kMaximumSize = std::size_t{64} * 1024;

std::optional<std::string> contentsOf(int directory, const char* name)
{
    const posix::FileDescriptor file(::openat(directory, name, O_RDONLY | O_CLOEXEC));
    if (!file)
        return std::nullopt;
    std::string text;
    std::array<char, 4096> part{};
    ssize_t count = 0;
    while (text.size() < kMaximumSize && (count = ::read(file.get(), part.data(), part.size())) > 0)
        text.append(part.data(), static_cast<std::size_t>(count));
    if (count < 0)
        return std::nullopt; // it has ended meanwhile
    return text;
}

bool areTheSame(const struct stat& one, const struct stat& other)
{
    return one.st_dev == other.st_dev && one.st_ino == other.st_ino;
}

/// Of a package that is confined, or of any other program that is, and we are not alike.
bool isConfiningLabel(const std::string& label, int self)
{
    if (!label.starts_with("snap.") && !label.ends_with(" (enforce)"))
        return false;
    std::string own = contentsOf(self, "attr/current").value_or("");
    own.erase(own.find_last_not_of(std::string_view("\n\0", 2)) + 1);
    return label != own;
}

bool isInCgroupOfPackage(int process)
{
    const auto cgroups = contentsOf(process, "cgroup");
    return !cgroups || cgroups->find("/snap.") != std::string::npos;
}

/// Whether a path leads both of us to the same file.
bool seesOurFiles(int process, int self)
{
    // The mounts first: that asks no file system, and those of a sandbox can be slow on purpose.
    struct stat theirs = {};
    struct stat ours = {};
    if (::fstatat(process, "ns/mnt", &theirs, 0) != 0 || ::fstatat(self, "ns/mnt", &ours, 0) != 0
        || !areTheSame(theirs, ours))
        return false;
    // Opened before it is looked into: a process that is ending has no root, and so no file in it either.
    const posix::FileDescriptor root(::openat(process, "root", O_PATH | O_DIRECTORY | O_CLOEXEC));
    if (!root || ::fstat(root.get(), &theirs) != 0 || ::fstatat(self, "root", &ours, 0) != 0
        || !areTheSame(theirs, ours))
        return false;
    // If it is there we are in a sandbox, too, where the bus's numbers are none of our processes'.
    return ::fstatat(root.get(), ".flatpak-info", &theirs, AT_SYMLINK_NOFOLLOW) != 0 && errno == ENOENT;
}

} // namespace

bool isConfined(const Asker& asker, const std::string& self)
{
    const posix::FileDescriptor own(::open(self.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
    return !asker.process || !own || isConfiningLabel(asker.securityLabel, own.get())
           || isInCgroupOfPackage(asker.process.get()) || !seesOurFiles(asker.process.get(), own.get());
}

} // namespace dbus

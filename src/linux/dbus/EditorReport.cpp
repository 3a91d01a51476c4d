#include "linux/dbus/EditorReport.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <fcntl.h>
#include <string_view>
#include <sys/mman.h>
#include <unistd.h>

namespace dbus {

namespace {

/// Above the numbers at which editors find what they inherit.
constexpr int kLeastDescriptor = 16;
/// An entry is three texts, each with a zero byte behind it.
constexpr std::size_t kTextsOfAnEntry = 3;
constexpr std::array<std::string_view, 3> kKinds{"saved", "unsaved", "refused"}; // in the order of their numbers
/// More than anybody saves in one session.
constexpr std::size_t kMaximumSize = std::size_t{1024} * 1024;

std::string contents(int file)
{
    std::string text;
    std::array<char, 4096> part{};
    while (text.size() < kMaximumSize) {
        const ssize_t count = ::pread(file, part.data(), part.size(), static_cast<off_t>(text.size()));
        if (count <= 0)
            break;
        text.append(part.data(), static_cast<std::size_t>(count));
    }
    return text;
}

} // namespace

base::Result<EditorReport> EditorReport::make()
{
    const posix::FileDescriptor file(::memfd_create("clipsa-report", MFD_CLOEXEC));
    posix::FileDescriptor high(file ? ::fcntl(file.get(), F_DUPFD_CLOEXEC, kLeastDescriptor) : -1);
    if (!high)
        return base::Error::fromErrno(errno, "cannot make the editor's report");
    return EditorReport(std::move(high));
}

void EditorReport::add(const MovieNote& note)
{
    std::string entry;
    for (const std::string_view text :
         {kKinds[static_cast<std::size_t>(note.kind)], std::string_view(note.path), std::string_view(note.why)}) {
        entry.append(text.substr(0, text.find('\0')));
        entry += '\0';
    }
    // In one piece, so that a crash leaves no half of it. There is nobody left to tell when it fails.
    [[maybe_unused]] const ssize_t written = ::write(descriptor(), entry.data(), entry.size());
}

std::vector<MovieNote> EditorReport::notes() const
{
    const std::string text = contents(descriptor());
    std::vector<MovieNote> notes;
    for (std::size_t at = 0;;) {
        std::array<std::string, kTextsOfAnEntry> texts;
        for (std::string& part : texts) {
            const std::size_t end = text.find('\0', at);
            if (end == std::string::npos)
                return notes;
            part = text.substr(at, end - at);
            at = end + 1;
        }
        const auto kind = std::find(kKinds.begin(), kKinds.end(), texts[0]);
        if (kind != kKinds.end())
            notes.push_back({static_cast<MovieNote::Kind>(kind - kKinds.begin()), texts[1], texts[2]});
    }
}

} // namespace dbus

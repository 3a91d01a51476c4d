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
/// An entry is three texts, each with a zero byte behind it: kind, place and reason. Those of shares have the receiver for
/// a place, and their reason has a line above it, with the type. A host passes over kinds that it does not know.
constexpr std::size_t kTextsOfAnEntry = 3;
constexpr std::array<std::string_view, 5> kKinds{"saved", "unsaved", "refused", "shared",
                                                 "unshared"}; // in the order of their numbers
/// More than anybody saves in one session.
constexpr std::size_t kMaximumSize = std::size_t{1024} * 1024;

bool isOfAShare(const MovieNote& note)
{
    return note.kind == MovieNote::Kind::Shared || note.kind == MovieNote::Kind::Unshared;
}

std::string_view fitting(std::string_view text)
{
    text = text.substr(0, text.find('\0'));
    if (text.size() <= EditorReport::kLongestText)
        return text;
    std::size_t end = EditorReport::kLongestText;
    while (end > 0 && (static_cast<unsigned char>(text[end]) & 0xC0U) == 0x80) // within a character
        --end;
    return text.substr(0, end);
}

MovieNote noteOf(MovieNote::Kind kind, std::string place, std::string reason)
{
    MovieNote note{kind};
    if (!isOfAShare(note)) {
        note.path = std::move(place);
        note.why = std::move(reason);
        return note;
    }
    const std::size_t end = std::min(reason.find('\n'), reason.size());
    note.receiver = std::move(place);
    note.type = reason.substr(0, end);
    note.why = reason.substr(std::min(end + 1, reason.size()));
    return note;
}

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
    const bool isShare = isOfAShare(note);
    std::string reason(fitting(note.why));
    if (isShare) {
        const std::string_view type = fitting(note.type);
        reason.insert(0, std::string(type.substr(0, type.find('\n'))) + "\n");
    }
    std::string entry(kKinds[static_cast<std::size_t>(note.kind)]);
    for (const std::string_view text : {fitting(isShare ? note.receiver : note.path), std::string_view(reason)}) {
        entry += '\0';
        entry += text;
    }
    entry += '\0';
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
            notes.push_back(noteOf(static_cast<MovieNote::Kind>(kind - kKinds.begin()), texts[1], texts[2]));
    }
}

} // namespace dbus

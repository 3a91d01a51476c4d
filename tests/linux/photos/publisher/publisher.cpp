// publisher [--hidden] [--traced] MOVIE: puts a movie into the user's library, as the app does, and prints where it is.
// For tests that kill it, or that give it a home of its own.
//
// --hidden  on a poor file system, where every byte is copied by hand into a file with a hidden name
// --traced  stops for its parent, a tracer, right before it begins

#include "linux/photos/VideoLibrary.h"
#include "support/RefusedSystemCalls.h"

#include <csignal>
#include <cstdio>
#include <string>
#include <sys/ptrace.h>

int main(int argc, char* argv[])
{
    bool traced = false;
    std::string movie;
    for (int i = 1; i < argc; ++i) {
        const std::string word = argv[i];
        if (word == "--hidden")
            tests::refuseSystemCalls(
                {tests::noUnnamedFiles(), tests::noReflinks(), {SYS_copy_file_range, EXDEV}, {SYS_sendfile, EINVAL}});
        else if (word == "--traced")
            traced = true;
        else
            movie = word;
    }

    base::StreamLog log(stderr, base::StreamLog::Style::Plain, false);
    base::WorkList works;
    photos::LibraryOptions options;
    options.directories = photos::UserDirectories::ofUser();
    options.recording = [](const std::string&) {
        return photos::Recording{"Tux Racer", base::Date{1'795'273'445}}; // 2026-11-21 15:04:05 UTC
    };
    options.thumbnail = [](const std::string&, int side) {
        platform::Bitmap bitmap = platform::Bitmap::transparent(side, side);
        bitmap.rgba.assign(bitmap.rgba.size(), 255);
        return std::optional(std::move(bitmap));
    };
    options.published = [](const std::string& path) { std::puts(path.c_str()); };

    if (traced && (::ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) != 0 || std::raise(SIGSTOP) != 0))
        return 3;
    bool saved = false;
    photos::VideoLibrary(std::move(options), log, works)
        .performChanges(
            [&](platform::PhotoLibraryChange& change) {
                change.createAssetFromVideoAtFileURL(base::Url::fromPath(movie));
            },
            [&](bool success, const base::ErrorRef&) { saved = success; });
    return saved ? 0 : 1;
}

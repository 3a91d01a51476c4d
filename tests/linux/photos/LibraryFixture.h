/// A home directory with a library of its own, and a recording to put there.
#pragma once

#include "linux/photos/VideoLibrary.h"
#include "support/Names.h"
#include "support/PrivateDirectory.h"

#include <ctime>
#include <filesystem>
#include <gmock/gmock.h>
#include <string>
#include <sys/stat.h>
#include <utility>
#include <vector>

namespace tests {

namespace fs = std::filesystem;

/// As the names of files tell it: in local time.
inline base::Date localDate(int year, int month, int day, int hour, int minute, int second)
{
    std::tm time = {};
    time.tm_year = year - 1900;
    time.tm_mon = month - 1;
    time.tm_mday = day;
    time.tm_hour = hour;
    time.tm_min = minute;
    time.tm_sec = second;
    time.tm_isdst = -1;
    return {static_cast<double>(std::mktime(&time))};
}

inline double modified(const fs::path& file)
{
    struct stat status = {};
    ::stat(file.c_str(), &status);
    return static_cast<double>(status.st_mtim.tv_sec) + static_cast<double>(status.st_mtim.tv_nsec) / 1e9;
}

/// Bytes that no two places, and no two seeds, have in common.
inline std::string movieBytes(std::size_t size, unsigned seed = 1)
{
    std::string bytes(size, '\0');
    std::uint64_t state = seed;
    for (char& byte : bytes) {
        state = state * 6364136223846793005U + 1442695040888963407U;
        byte = static_cast<char>(state >> 56U);
    }
    return bytes;
}

/// Whether a file, which may be large, holds just these bytes.
inline bool holds(const fs::path& file, const std::string& bytes)
{
    std::string found(bytes.size() + 1, '\0');
    std::ifstream stream(file, std::ios::binary);
    stream.read(found.data(), static_cast<std::streamsize>(found.size()));
    found.resize(static_cast<std::size_t>(stream.gcount()));
    return found == bytes;
}

struct Outcome {
    int completions = 0;
    bool success = false;
    base::ErrorRef error;

    std::int64_t code() const { return error ? error->code() : 0; }
    std::string text() const { return error ? error->description() : ""; }
};

class LibraryFixture : public testing::Test {
protected:
    /// More than one step of every way to copy by hand.
    static constexpr std::size_t kSize = 3'000'001;

    explicit LibraryFixture(const fs::path& parent = fs::temp_directory_path()) : home(parent) {}

    PrivateDirectory home;
    const fs::path videos = home.path() / "Videos";
    const std::string bytes = movieBytes(kSize);
    const fs::path source = home.write("cache/movie.mp4", bytes);
    base::MemoryLog log;
    base::WorkList works;
    photos::Recording recording{"Tux Racer", localDate(2026, 11, 21, 15, 4, 5)};
    const std::string name = "Tux Racer 2026-11-21 15-04-05.mp4";
    std::vector<std::string> published;

    photos::LibraryOptions options()
    {
        photos::LibraryOptions made;
        made.directories = {videos, home.path() / ".cache/thumbnails", home.path() / ".local/share/recently-used.xbel"};
        made.recording = [this](const std::string&) { return recording; };
        made.published = [this](const std::string& path) { published.push_back(path); };
        return made;
    }

    /// Puts one movie into the library, and waits.
    Outcome save(const std::optional<base::Url>& url, photos::LibraryOptions with)
    {
        Outcome outcome;
        photos::VideoLibrary(std::move(with), log, works)
            .performChanges([&](platform::PhotoLibraryChange& change) { change.createAssetFromVideoAtFileURL(url); },
                            [&](bool success, const base::ErrorRef& error) {
                                ++outcome.completions;
                                outcome.success = success;
                                outcome.error = error;
                            });
        return outcome;
    }
    Outcome save(const fs::path& path) { return save(base::Url::fromPath(path), options()); }
    Outcome save() { return save(source); }

    std::vector<std::string> errors() const { return log.texts(base::MemoryLog::Line::Kind::Error); }

    /// The one way to fail: told once, by name, on the log too; nothing half done, and the recording as it was.
    void expectFailure(const Outcome& outcome, int code, const std::vector<std::string>& left = {})
    {
        EXPECT_EQ(outcome.completions, 1);
        EXPECT_FALSE(outcome.success);
        EXPECT_EQ(outcome.code(), code) << outcome.text();
        EXPECT_THAT(errors(), testing::ElementsAre(outcome.text()));
        EXPECT_EQ(namesIn(videos), left);
        EXPECT_THAT(published, testing::IsEmpty());
        EXPECT_TRUE(works.isEmpty());
        EXPECT_TRUE(holds(source, bytes)) << "the recording was touched";
    }
};

} // namespace tests

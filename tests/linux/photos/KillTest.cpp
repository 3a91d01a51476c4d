// The process is killed in the middle of a save, at every place where it talks to the kernel. Whatever the place, the
// library holds the whole movie or nothing, and the recording is as it was.

#include "linux/photos/LibraryFixture.h"
#include "support/Child.h"
#include "support/Paths.h"

#include <glib.h>
#include <memory>
#include <png.h>
#include <sys/ptrace.h>
#include <sys/wait.h>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;
namespace fs = std::filesystem;

/// A publisher that is stopped before and after each of its system calls. The thread that made it drives it.
class TracedPublisher {
public:
    TracedPublisher(std::vector<std::string> words, std::vector<std::string> environment)
    {
        words.insert(words.begin(), tests::program("photos-publisher"));
        const auto pointersTo = [](std::vector<std::string>& texts) {
            std::vector<char*> pointers;
            for (std::string& text : texts)
                pointers.push_back(text.data());
            pointers.push_back(nullptr);
            return pointers;
        };
        posix_spawn_file_actions_t files;
        ::posix_spawn_file_actions_init(&files);
        ::posix_spawn_file_actions_addopen(&files, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
        const int error = ::posix_spawn(&m_process, words.front().c_str(), &files, nullptr, pointersTo(words).data(),
                                        pointersTo(environment).data());
        ::posix_spawn_file_actions_destroy(&files);
        if (error != 0)
            throw std::runtime_error("cannot start the publisher");
    }
    ~TracedPublisher() { kill(); }
    TracedPublisher(const TracedPublisher&) = delete;
    TracedPublisher& operator=(const TracedPublisher&) = delete;

    /// Until it has been stopped `stops` times, or has ended: gives the number of stops.
    int run(int stops)
    {
        int count = 0;
        while (count < stops && m_process > 0) {
            int status = 0;
            const pid_t thread = ::waitpid(-1, &status, __WALL);
            if (thread < 0)
                break;
            if (WIFEXITED(status) || WIFSIGNALED(status)) {
                if (thread == m_process) {
                    m_process = -1;
                    m_exitStatus = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
                }
                continue;
            }
            if (!m_begun) {
                m_begun = true;
                ::ptrace(PTRACE_SETOPTIONS, thread, nullptr,
                         PTRACE_O_TRACESYSGOOD | PTRACE_O_TRACECLONE | PTRACE_O_EXITKILL);
            }
            if (WSTOPSIG(status) == (SIGTRAP | 0x80) && ++count == stops)
                break;
            // Their first stop, and the one that it asks for itself, are for us; no other signals come.
            ::ptrace(PTRACE_SYSCALL, thread, nullptr, nullptr);
        }
        return count;
    }

    void kill()
    {
        if (m_process <= 0)
            return;
        ::kill(m_process, SIGKILL);
        int status = 0;
        while (::waitpid(-1, &status, __WALL) > 0) {}
        m_process = -1;
    }

    int exitStatus() const { return m_exitStatus; }

private:
    pid_t m_process = -1;
    bool m_begun = false;
    int m_exitStatus = -1;
};

class ASaveThatIsKilled : public tests::LibraryFixture, public testing::WithParamInterface<bool> {
protected:
    static constexpr int kMostPoints = 200;

    /// In memory: what a killed process has written is not lost, and a disk would take minutes.
    ASaveThatIsKilled() : LibraryFixture("/dev/shm") {}

    std::vector<std::string> words() const
    {
        return GetParam() ? std::vector<std::string>{"--hidden", "--traced", source}
                          : std::vector<std::string>{"--traced", source};
    }
    std::vector<std::string> environment() const
    {
        // A sanitizer cannot look for leaks in what is traced already.
        return {"HOME=" + home.path().native(), "TZ=UTC", "ASAN_OPTIONS=detect_leaks=0", "TSAN_OPTIONS=report_bugs=0"};
    }
    void forgetAll()
    {
        for (const char* made : {"Videos", ".cache", ".local"})
            fs::remove_all(home.path() / made);
    }

    /// Gives whether the movie is there.
    bool expectAllOrNothing()
    {
        bool there = false;
        for (const std::string& file : tests::namesIn(videos)) {
            if (GetParam() && file.starts_with(".clipsa-") && file.ends_with(".part"))
                continue;
            there = true;
            EXPECT_EQ(file, name);
            EXPECT_TRUE(tests::holds(videos / file, bytes)) << "a part of the movie";
        }
        EXPECT_TRUE(tests::holds(source, bytes)) << "the recording was touched";
        return there;
    }
    /// Also what other programs read is whole or not there.
    void expectWholeAppearance()
    {
        const fs::path thumbnails = home.path() / ".cache/thumbnails/large";
        for (const std::string& file : tests::namesIn(thumbnails)) {
            png_image image = {};
            image.version = PNG_IMAGE_VERSION;
            image.format = PNG_FORMAT_RGBA;
            std::vector<std::uint8_t> pixels;
            if (!file.ends_with(".png"))
                continue; // on its way
            EXPECT_TRUE(png_image_begin_read_from_file(&image, (thumbnails / file).c_str())) << image.message;
            pixels.resize(PNG_IMAGE_SIZE(image));
            EXPECT_TRUE(png_image_finish_read(&image, nullptr, pixels.data(), 0, nullptr)) << image.message;
        }
        const fs::path list = home.path() / ".local/share/recently-used.xbel";
        const std::unique_ptr<GBookmarkFile, decltype(&g_bookmark_file_free)> bookmarks(g_bookmark_file_new(),
                                                                                        &g_bookmark_file_free);
        EXPECT_TRUE(!fs::exists(list) || g_bookmark_file_load_from_file(bookmarks.get(), list.c_str(), nullptr));
    }
};

TEST_P(ASaveThatIsKilled, LeavesTheWholeMovieOrNothing)
{
    int stops = 0;
    {
        TracedPublisher whole(words(), environment());
        stops = whole.run(1'000'000);
        ASSERT_EQ(whole.exitStatus(), 0);
        ASSERT_TRUE(expectAllOrNothing());
    }
    ASSERT_GT(stops, kMostPoints / 2) << "there is more than that to do";
    const int points = std::min(stops, kMostPoints);

    int found = 0;
    int swept = 0;
    for (int point = 0; point < points; ++point) {
        const int stop = 1 + point * (stops - 1) / (points - 1);
        forgetAll();
        {
            TracedPublisher publisher(words(), environment());
            publisher.run(stop);
            publisher.kill();
        }
        SCOPED_TRACE("killed at " + std::to_string(stop) + " of " + std::to_string(stops));
        const bool there = expectAllOrNothing();
        found += there ? 1 : 0;
        expectWholeAppearance();

        // The next one finds its way, and leaves no more behind than the movies.
        const auto leftovers = tests::namesIn(videos).size() - (there ? 1 : 0);
        swept += leftovers > 0 ? 1 : 0;
        ASSERT_TRUE(save().success);
        EXPECT_EQ(tests::namesIn(videos).size(), there ? 2U : 1U);
        EXPECT_TRUE(tests::holds(published.back(), bytes));
    }
    // Both ends of the save were among the points, and so was its middle.
    EXPECT_GT(found, 0);
    EXPECT_LT(found, points);
    EXPECT_EQ(swept > 0, GetParam());
}

INSTANTIATE_TEST_SUITE_P(FileSystems, ASaveThatIsKilled, testing::Bool(),
                         [](const auto& kind) { return kind.param ? "WithHiddenFiles" : "WithUnnamedFiles"; });

} // namespace

// The process is killed in the middle of a save, at every place where it talks to the kernel. Whatever the place, the
// library holds the whole movie or nothing, and the recording is as it was.

#include "linux/photos/LibraryFixture.h"
#include "linux/photos/TracedPublisher.h"

#include <glib.h>
#include <memory>
#include <png.h>

namespace {

namespace fs = std::filesystem;

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
        tests::TracedPublisher whole(words(), environment());
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
            tests::TracedPublisher publisher(words(), environment());
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

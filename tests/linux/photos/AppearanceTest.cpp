// How a movie appears to the user's other programs: thumbnail and recent files.

#include "linux/photos/LibraryFixture.h"
#include "linux/photos/RecentFiles.h"
#include "support/Child.h"
#include "support/Paths.h"

#include <glib.h>
#include <map>
#include <memory>
#include <png.h>

namespace {

using testing::AllOf;
using testing::Each;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;
using tests::PrivateDirectory;
namespace fs = std::filesystem;

platform::Bitmap picture(int width, int height)
{
    platform::Bitmap bitmap = platform::Bitmap::transparent(width, height);
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
            bitmap.at(x, y)[0] = static_cast<std::uint8_t>(x);
            bitmap.at(x, y)[1] = static_cast<std::uint8_t>(y);
            bitmap.at(x, y)[2] = 7;
            bitmap.at(x, y)[3] = 255;
        }
    return bitmap;
}

mode_t modeOf(const fs::path& path)
{
    struct stat status = {};
    EXPECT_EQ(::stat(path.c_str(), &status), 0) << path;
    return status.st_mode & 07777;
}

/// The texts of a PNG file that are in chunks of the plain kind.
std::map<std::string, std::string> plainTexts(const std::string& png)
{
    std::map<std::string, std::string> texts;
    for (std::size_t at = 8; at + 12 <= png.size();) {
        std::size_t length = 0;
        for (std::size_t i = 0; i < 4; ++i)
            length = length << 8U | static_cast<unsigned char>(png[at + i]);
        const std::string data = png.substr(at + 8, length);
        if (png.compare(at + 4, 4, "tEXt") == 0)
            texts[data.c_str()] = data.substr(data.find('\0') + 1);
        at += 12 + length;
    }
    return texts;
}

class ASavedMovie : public tests::LibraryFixture {
protected:
    const fs::path thumbnails = home.path() / ".cache/thumbnails";
    const fs::path list = home.path() / ".local/share/recently-used.xbel";
    platform::Bitmap bitmap = picture(256, 144);

    photos::LibraryOptions withPicture()
    {
        auto with = options();
        with.thumbnail = [this](const std::string& path, int side) {
            EXPECT_TRUE(tests::holds(path, bytes)) << "the movie is there when its picture is made";
            EXPECT_EQ(side, 256);
            return bitmap;
        };
        return with;
    }
    tests::Outcome saveWithPicture() { return save(base::Url::fromPath(source), withPicture()); }

    fs::path thumbnail() const
    {
        const auto names = tests::namesIn(thumbnails / "large");
        EXPECT_THAT(names, SizeIs(1));
        return names.empty() ? fs::path() : thumbnails / "large" / names.front();
    }
    std::string uri() const { return "file://" + videos.native() + "/Tux%20Racer%202026-11-21%2015-04-05.mp4"; }
    /// What a desktop's own tool says.
    std::string gio(const std::vector<std::string>& words) const
    {
        std::vector<std::string> command{"gio"};
        command.insert(command.end(), words.begin(), words.end());
        tests::Child child(command, {"PATH=/usr/bin:/bin", "HOME=" + home.path().native(), "LC_ALL=C",
                                     "XDG_CACHE_HOME=" + (home.path() / ".cache").native()});
        return child.wait().out;
    }
};

TEST_F(ASavedMovie, HasAThumbnailThatSaysOfWhichFileItIs)
{
    ASSERT_TRUE(saveWithPicture().success);
    EXPECT_THAT(errors(), IsEmpty());
    const auto texts = plainTexts(PrivateDirectory::read(thumbnail()));
    EXPECT_EQ(texts.at("Thumb::URI"), uri());
    EXPECT_EQ(texts.at("Thumb::MTime"), std::to_string(recording.date->wholeSeconds()));
    EXPECT_EQ(texts.at("Thumb::Size"), std::to_string(bytes.size()));
    EXPECT_EQ(texts.at("Thumb::Mimetype"), "video/mp4");
}

TEST_F(ASavedMovie, HasAThumbnailThatOnlyItsUserMayRead)
{
    ASSERT_TRUE(saveWithPicture().success);
    EXPECT_EQ(modeOf(thumbnail()), 0600U);
    EXPECT_EQ(modeOf(thumbnails / "large"), 0700U);
    EXPECT_EQ(modeOf(thumbnails), 0700U);
}

TEST_F(ASavedMovie, HasAThumbnailWithThePictureOfTheMovie)
{
    ASSERT_TRUE(saveWithPicture().success);
    png_image image = {};
    image.version = PNG_IMAGE_VERSION;
    ASSERT_TRUE(png_image_begin_read_from_file(&image, thumbnail().c_str())) << image.message;
    image.format = PNG_FORMAT_RGBA;
    std::vector<std::uint8_t> pixels(PNG_IMAGE_SIZE(image));
    ASSERT_TRUE(png_image_finish_read(&image, nullptr, pixels.data(), 0, nullptr)) << image.message;
    EXPECT_EQ(image.width, 256U);
    EXPECT_EQ(image.height, 144U);
    EXPECT_EQ(pixels, bitmap.rgba);
}

TEST_F(ASavedMovie, HasAThumbnailThatDesktopsFindAndTakeForValid)
{
    ASSERT_TRUE(saveWithPicture().success);
    const std::string said = gio({"info", "-a", "thumbnail::*", published.front()});
    EXPECT_THAT(said, HasSubstr("thumbnail::path: " + thumbnail().native()));
    EXPECT_THAT(said, HasSubstr("thumbnail::is-valid: TRUE"));
}

TEST_F(ASavedMovie, ReplacesTheThumbnailOfAnEarlierFile)
{
    ASSERT_TRUE(saveWithPicture().success);
    fs::remove(published.front());
    bitmap = picture(64, 256);
    ASSERT_TRUE(saveWithPicture().success);
    png_image image = {};
    image.version = PNG_IMAGE_VERSION;
    ASSERT_TRUE(png_image_begin_read_from_file(&image, thumbnail().c_str()));
    EXPECT_EQ(image.width, 64U);
    png_image_free(&image);
}

TEST_F(ASavedMovie, IsSavedAllTheSameWithoutAPicture)
{
    auto with = options();
    with.thumbnail = [](const std::string&, int) { return std::nullopt; };
    EXPECT_TRUE(save(base::Url::fromPath(source), with).success);
    EXPECT_THAT(errors(), ElementsAre("no thumbnail of " + (videos / name).native() + ": there is no picture of it"));
    EXPECT_FALSE(fs::exists(thumbnails));
}

TEST_F(ASavedMovie, IsSavedAllTheSameWithAPictureThatIsNone)
{
    for (const auto& wrong : {picture(257, 10), picture(10, 257), platform::Bitmap{10, 10, {1, 2, 3}},
                              platform::Bitmap{}, platform::Bitmap{0, 10, {}}, platform::Bitmap{10, 0, {}}}) {
        bitmap = wrong;
        EXPECT_TRUE(saveWithPicture().success);
    }
    EXPECT_THAT(errors(), AllOf(SizeIs(6), Each(HasSubstr("wrong size"))));
    EXPECT_FALSE(fs::exists(thumbnails));
}

TEST_F(ASavedMovie, HasAThumbnailOfThePictureHoweverSmall)
{
    bitmap = picture(1, 1);
    EXPECT_TRUE(saveWithPicture().success);
    EXPECT_THAT(errors(), IsEmpty());
    EXPECT_TRUE(fs::exists(thumbnail()));
}

TEST_F(ASavedMovie, IsSavedAllTheSameWhereNoThumbnailAndNoListCanBeWritten)
{
    home.write(".cache/thumbnails", "a file");
    home.write(".local", "a file");
    EXPECT_TRUE(saveWithPicture().success);
    EXPECT_EQ(tests::namesIn(videos), std::vector{name});
    EXPECT_THAT(errors(), ElementsAre(HasSubstr(".cache/thumbnails"), HasSubstr("recently-used.xbel")));
}

TEST_F(ASavedMovie, IsSavedAllTheSameWhereThePlaceOfThumbnailsLeadsRoundInCircles)
{
    fs::create_symlink(".cache", home.path() / ".cache");
    EXPECT_TRUE(saveWithPicture().success);
    EXPECT_EQ(tests::namesIn(videos), std::vector{name});
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("no thumbnail of")));
}

using Bookmarks = std::unique_ptr<GBookmarkFile, decltype(&g_bookmark_file_free)>;

Bookmarks bookmarksIn(const fs::path& list)
{
    Bookmarks bookmarks(g_bookmark_file_new(), &g_bookmark_file_free);
    EXPECT_TRUE(g_bookmark_file_load_from_file(bookmarks.get(), list.c_str(), nullptr)) << list;
    return bookmarks;
}

TEST_F(ASavedMovie, IsAmongTheRecentFiles)
{
    ASSERT_TRUE(save().success);
    const auto bookmarks = bookmarksIn(list);
    ASSERT_TRUE(g_bookmark_file_has_item(bookmarks.get(), uri().c_str()));
    const std::unique_ptr<char, decltype(&g_free)> type(
        g_bookmark_file_get_mime_type(bookmarks.get(), uri().c_str(), nullptr), &g_free);
    EXPECT_STREQ(type.get(), "video/mp4");
    EXPECT_TRUE(g_bookmark_file_has_application(bookmarks.get(), uri().c_str(), "Clipsa", nullptr));
    EXPECT_EQ(modeOf(list), 0600U);
}

TEST_F(ASavedMovie, LeavesTheOtherRecentFilesWhereTheyAre)
{
    ASSERT_TRUE(photos::addRecentFile(list, "/a/letter.txt"));
    {
        // Another program's entry, made while the library is there already.
        photos::VideoLibrary library(options(), log, works);
        ASSERT_TRUE(photos::addRecentFile(list, "/a/song.ogv"));
        library.performChanges(
            [&](platform::PhotoLibraryChange& change) {
                change.createAssetFromVideoAtFileURL(base::Url::fromPath(source));
            },
            [](bool, const base::ErrorRef&) {});
    }
    const auto bookmarks = bookmarksIn(list);
    EXPECT_EQ(g_bookmark_file_get_size(bookmarks.get()), 3);
    for (const std::string& entry : {std::string("file:///a/letter.txt"), std::string("file:///a/song.ogv"), uri()})
        EXPECT_TRUE(g_bookmark_file_has_item(bookmarks.get(), entry.c_str())) << entry;
    EXPECT_THAT(tests::namesIn(list.parent_path()), ElementsAre("recently-used.xbel")) << "nothing is left beside it";
}

TEST_F(ASavedMovie, LeavesAListThatItCannotReadAsItIs)
{
    home.write(".local/share/recently-used.xbel", "<xbel> broken");
    EXPECT_TRUE(save().success);
    EXPECT_EQ(PrivateDirectory::read(list), "<xbel> broken");
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("is not among the recent files: reading " + list.native())));
}

TEST_F(ASavedMovie, IsFoundWhereTheUserHasSetTheDirectoryForVideos)
{
    // In a process of its own: the settings are read once in each.
    const std::string movie = source.native();
    const auto run = [&](std::vector<std::string> environment) {
        environment.insert(environment.end(), {"HOME=" + home.path().native(), "TZ=UTC"});
        tests::Child child({tests::program("photos-publisher"), movie}, environment);
        return child.wait();
    };
    const std::string date = "Tux Racer 2026-11-21 15-04-05.mp4\n";
    EXPECT_EQ(run({}).out, (home.path() / "Videos").native() + "/" + date);
    home.write(".config/user-dirs.dirs", "XDG_VIDEOS_DIR=\"$HOME/Films//clips/\"\n");
    EXPECT_EQ(run({}).out, (home.path() / "Films/clips").native() + "/" + date);
    home.write("set/user-dirs.dirs", "XDG_VIDEOS_DIR=\"" + home.path().native() + "/Kino\"\n");
    const auto end =
        run({"XDG_CONFIG_HOME=" + (home.path() / "set").native(), "XDG_DATA_HOME=" + (home.path() / "data").native()});
    EXPECT_EQ(end.out, (home.path() / "Kino").native() + "/" + date) << end.err;
    EXPECT_TRUE(fs::exists(home.path() / "data/recently-used.xbel"));
}

} // namespace

#include "linux/photos/Thumbnail.h"

#include "linux/photos/GLibText.h"
#include "linux/photos/MediaType.h"
#include "linux/photos/VideoLibrary.h"

#include <cerrno>
#include <filesystem>
#include <glib.h>
#include <map>
#include <memory>
#include <png.h>
#include <sys/stat.h>
#include <system_error>
#include <vector>

namespace photos {

namespace {

namespace fs = std::filesystem;

using Texts = std::map<std::string, std::string>;
using Bytes = std::vector<png_byte>;

void append(png_structp png, png_bytep data, std::size_t length)
{
    auto& bytes = *static_cast<Bytes*>(png_get_io_ptr(png));
    bytes.insert(bytes.end(), data, data + length);
}

/// The library leaves by longjmp when it fails: nothing in here has a destructor to run.
bool encode(png_structp png, png_infop info, png_bytepp rows, png_uint_32 width, png_uint_32 height, png_textp texts,
            int textCount)
{
    if (setjmp(png_jmpbuf(png)) != 0) // NOLINT(cert-err52-cpp): the only way it has
        return false;
    png_set_IHDR(png, info, width, height, 8, PNG_COLOR_TYPE_RGBA, PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT,
                 PNG_FILTER_TYPE_DEFAULT);
    png_set_text(png, info, texts, textCount);
    png_set_rows(png, info, rows);
    png_write_png(png, info, PNG_TRANSFORM_IDENTITY, nullptr);
    return true;
}

/// Empty when it cannot be done. Movies are opaque, so that premultiplied and plain colours are the same.
Bytes pngOf(platform::Bitmap bitmap, Texts texts)
{
    std::vector<png_bytep> rows;
    for (int y = 0; y < bitmap.height; ++y)
        rows.push_back(bitmap.at(0, y));
    // Uncompressed ones (tEXt): readers do not look into the others.
    std::vector<png_text> chunks;
    for (auto& [key, text] : texts) {
        png_text chunk = {};
        chunk.compression = PNG_TEXT_COMPRESSION_NONE;
        chunk.key = const_cast<char*>(key.c_str()); // it is only read
        chunk.text = text.data();
        chunks.push_back(chunk);
    }

    Bytes bytes;
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png ? png_create_info_struct(png) : nullptr;
    if (info) {
        png_set_write_fn(png, &bytes, &append, nullptr);
        if (!encode(png, info, rows.data(), static_cast<png_uint_32>(bitmap.width),
                    static_cast<png_uint_32>(bitmap.height), chunks.data(), static_cast<int>(chunks.size())))
            bytes.clear();
    }
    png_destroy_write_struct(&png, &info);
    return bytes;
}

/// Private, as it is asked of all who write there.
base::Result<void> makePrivateDirectory(const fs::path& path)
{
    std::error_code ignored; // what cannot be looked at cannot be made either
    if (path.has_relative_path() && !fs::exists(path.parent_path(), ignored))
        if (auto made = makePrivateDirectory(path.parent_path()); !made)
            return made;
    if (::mkdir(path.c_str(), 0700) != 0 && errno != EEXIST)
        return base::Error::fromErrno(errno, "making the directory " + path.native());
    return {};
}

/// Beside its name first, so that nobody reads half a picture.
base::Result<void> writeAtOnce(const fs::path& path, const Bytes& bytes)
{
    constexpr int kPrivate = 0600;
    GError* raw = nullptr;
    if (g_file_set_contents_full(path.c_str(), reinterpret_cast<const char*>(bytes.data()),
                                 static_cast<gssize>(bytes.size()), G_FILE_SET_CONTENTS_CONSISTENT, kPrivate, &raw))
        return {};
    const std::unique_ptr<GError, decltype(&g_error_free)> error(raw, &g_error_free);
    return base::Error::make(base::kPosixErrorDomain, EIO, error->message);
}

} // namespace

base::Result<void> writeThumbnail(const std::string& thumbnails, const std::string& file,
                                  const platform::Bitmap& bitmap)
{
    const auto pixels = static_cast<std::size_t>(bitmap.width) * static_cast<std::size_t>(bitmap.height);
    if (bitmap.width < 1 || bitmap.height < 1 || bitmap.width > kThumbnailSide || bitmap.height > kThumbnailSide
        || bitmap.rgba.size() != 4 * pixels)
        return base::Error::make(base::kPosixErrorDomain, EINVAL, "a picture of the wrong size");
    struct stat status = {};
    if (::stat(file.c_str(), &status) != 0)
        return base::Error::fromErrno(errno, "looking at " + file);

    const std::string uri = uriOf(file);
    const Bytes png = pngOf(bitmap, {{"Thumb::URI", uri},
                                     {"Thumb::MTime", std::to_string(status.st_mtim.tv_sec)},
                                     {"Thumb::Size", std::to_string(status.st_size)},
                                     {"Thumb::Mimetype", mediaType(file)},
                                     {"Software", "Clipsa"}});
    if (png.empty())
        return base::Error::make(base::kPosixErrorDomain, EIO, "the picture cannot be written as PNG");
    const fs::path directory = fs::path(thumbnails) / "large";
    if (auto made = makePrivateDirectory(directory); !made)
        return made;
    return writeAtOnce(directory / (md5Of(uri) + ".png"), png);
}

} // namespace photos

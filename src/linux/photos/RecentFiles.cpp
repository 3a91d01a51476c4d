#include "linux/photos/RecentFiles.h"

#include "linux/photos/GLibText.h"
#include "linux/photos/MediaType.h"

#include <cerrno>
#include <filesystem>
#include <glib.h>
#include <memory>
#include <sys/stat.h>

namespace photos {

namespace {

/// How a program that reads the list opens the file with us; GLib fills in the address.
constexpr const char* kProgram = "Clipsa";
constexpr const char* kCommand = "clipsa open %f";

class GLibError {
public:
    ~GLibError() { g_clear_error(&m_error); }
    GError** operator&() { return &m_error; } // NOLINT(google-runtime-operator): as the library asks for it
    bool isMissingFile() const { return g_error_matches(m_error, G_FILE_ERROR, G_FILE_ERROR_NOENT); }
    base::ErrorRef with(const std::string& doing) const
    {
        return base::Error::make(base::kPosixErrorDomain, EIO, doing + ": " + (m_error ? m_error->message : "unknown"));
    }

private:
    GError* m_error = nullptr;
};

} // namespace

base::Result<void> addRecentFile(const std::string& list, const std::string& file)
{
    const std::unique_ptr<GBookmarkFile, decltype(&g_bookmark_file_free)> bookmarks(g_bookmark_file_new(),
                                                                                    &g_bookmark_file_free);
    // Read anew each time, and as late as can be: others write it too.
    GLibError unread;
    if (!g_bookmark_file_load_from_file(bookmarks.get(), list.c_str(), &unread) && !unread.isMissingFile())
        return unread.with("reading " + list);

    const std::string uri = uriOf(file);
    g_bookmark_file_set_mime_type(bookmarks.get(), uri.c_str(), mediaType(file).c_str());
    g_bookmark_file_add_application(bookmarks.get(), uri.c_str(), kProgram, kCommand);

    std::error_code ignored;
    std::filesystem::create_directories(std::filesystem::path(list).parent_path(), ignored);
    GLibError unwritten;
    if (!g_bookmark_file_to_file(bookmarks.get(), list.c_str(), &unwritten))
        return unwritten.with("writing " + list);
    // What somebody has looked at is nobody else's business.
    ::chmod(list.c_str(), 0600);
    return {};
}

} // namespace photos

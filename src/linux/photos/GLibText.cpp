#include "linux/photos/GLibText.h"

#include <glib.h>
#include <memory>

namespace photos {

namespace {

std::string taken(char* text)
{
    const std::unique_ptr<char, decltype(&g_free)> owned(text, &g_free);
    return text ? text : "";
}

} // namespace

std::string uriOf(const std::string& path)
{
    return taken(g_filename_to_uri(path.c_str(), nullptr, nullptr));
}

std::string md5Of(const std::string& text)
{
    return taken(
        g_compute_checksum_for_data(G_CHECKSUM_MD5, reinterpret_cast<const guchar*>(text.data()), text.size()));
}

} // namespace photos

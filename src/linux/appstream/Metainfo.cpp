#include "linux/appstream/Metainfo.h"

#include "linux/appstream/DeveloperElement.h"
#include "linux/appstream/GObjects.h"

#include <appstream.h>
#include <fstream>
#include <gio/gio.h>
#include <iterator>
#include <system_error>
#include <utility>

namespace appstream {

namespace {

namespace fs = std::filesystem;

bool isSafeIdentifier(const std::string& identifier)
{
    constexpr std::size_t kLongest = 200; // bytes; leaves room for the ending in a file's name
    return !identifier.empty() && identifier.size() <= kLongest && identifier.front() != '.'
           && identifier.find('/') == std::string::npos && identifier.find('\0') == std::string::npos;
}

} // namespace

Metainfo::Metainfo(base::Log& log, std::vector<fs::path> directories)
    : m_log(log), m_directories(std::move(directories))
{
}

std::optional<fs::path> Metainfo::fileOf(const std::string& identifier) const
{
    const std::string plain = withoutDesktop(identifier);
    if (!isSafeIdentifier(plain))
        return std::nullopt;
    for (const fs::path& directory : m_directories)
        // The second is what such files were called before.
        for (const char* ending : {".metainfo.xml", ".appdata.xml", ".desktop.metainfo.xml", ".desktop.appdata.xml"}) {
            std::error_code error;
            // Only plain files have a size, and an end.
            if (fs::path file = directory / (plain + ending); fs::file_size(file, error) <= kLargestFile && !error)
                return file;
        }
    return std::nullopt;
}

std::optional<Component> Metainfo::find(const std::string& identifier, const std::string& locale) const
{
    const auto path = fileOf(identifier);
    if (!path)
        return std::nullopt;
    const Owned<AsMetadata> metadata(as_metadata_new());
    as_metadata_set_locale(metadata.get(), locale.c_str());
    as_metadata_set_format_style(metadata.get(), AS_FORMAT_STYLE_METAINFO);
    const Owned<GFile> file(g_file_new_for_path(path->c_str()));
    Failure failure;
    as_metadata_parse_file(metadata.get(), file.get(), AS_FORMAT_KIND_XML, failure.place());
    if (failure) {
        m_log.error(path->native() + " cannot be read: " + failure.description());
        return std::nullopt;
    }
    AsComponent* const component = as_metadata_get_component(metadata.get());
    if (component && !as_component_get_developer_name(component)) {
        std::ifstream stream(*path, std::ios::binary);
        const std::string xml{std::istreambuf_iterator<char>(stream), {}};
        if (const auto developer = developerElement(xml))
            as_component_set_developer_name(component, developer->c_str(), "C");
    }
    return component ? std::optional<Component>(component) : std::nullopt;
}

} // namespace appstream

#include "linux/appstream/CatalogueFiles.h"

#include <string_view>
#include <system_error>

namespace appstream {

namespace {

namespace fs = std::filesystem;

/// How much longer such texts get when they are unpacked.
constexpr std::uintmax_t kPacked = 8;

void add(CatalogueFiles& files, const fs::path& directory)
{
    std::error_code error;
    for (auto entry = fs::directory_iterator(directory, error); !error && entry != end(entry); entry.increment(error)) {
        const std::string name = entry->path().filename();
        const bool isText = name.ends_with(".xml") || name.ends_with(".yml") || name.ends_with(".yaml");
        const bool isPacked = name.ends_with(".gz");
        std::error_code unknown;
        const std::uintmax_t size = isText || isPacked ? entry->file_size(unknown) : 0;
        if ((!isText && !isPacked) || unknown)
            continue;
        files.size += isPacked ? size * kPacked : size;
        if (files.count++ == 0)
            files.first = entry->path();
    }
}

/// A directory for each remote, a directory for each kind of machine in it.
void addRemotes(CatalogueFiles& files, const fs::path& appstream)
{
    std::error_code error;
    for (auto remote = fs::directory_iterator(appstream, error); !error && remote != end(remote);
         remote.increment(error)) {
        std::error_code inner;
        for (auto machine = fs::directory_iterator(remote->path(), inner); !inner && machine != end(machine);
             machine.increment(inner)) {
            // The same lies there twice, and only the packed one is read.
            const fs::path packed = machine->path() / "active/appstream.xml.gz";
            std::error_code none;
            if (const std::uintmax_t size = fs::file_size(packed, none); !none) {
                files.size += size * kPacked;
                if (files.count++ == 0)
                    files.first = packed;
            }
        }
    }
}

} // namespace

CatalogueFiles catalogueFiles(const storefront::Options& options)
{
    CatalogueFiles files;
    for (const fs::path& directory : options.catalogues)
        for (const char* kind : {"", "xml", "yaml"})
            add(files, directory / kind);
    if (options.usesMachineCatalogues) {
        for (const char* place : {"/usr/share", "/var/lib", "/var/cache"})
            for (const char* kind :
                 {"swcatalog/xml", "swcatalog/yaml", "app-info/xml", "app-info/xmls", "app-info/yaml"})
                add(files, fs::path(place) / kind);
        for (const fs::path& directory : options.remotes)
            addRemotes(files, directory);
    }
    return files;
}

} // namespace appstream

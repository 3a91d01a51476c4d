/// How much there is to read in the catalogues. Any thread.
#pragma once

#include "linux/storefront/Options.h"

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace appstream {

struct CatalogueFiles {
    std::size_t count = 0;
    /// Of text, in bytes; of what is compressed, about.
    std::uintmax_t size = 0;
    /// One of them, for the log; empty when there is none.
    std::filesystem::path first;
};

/// The files of all catalogues that the options allow.
CatalogueFiles catalogueFiles(const storefront::Options& options);

} // namespace appstream

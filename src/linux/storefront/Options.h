/// Where the store looks, and in which languages.
#pragma once

#include "base/Environment.h"

#include <chrono>
#include <filesystem>
#include <string>
#include <vector>

namespace storefront {

struct Options {
    /// Languages as locales without a codeset ("de_AT", "sr@latin"), most preferred first, and "C" for texts as they were
    /// written. Never empty.
    std::vector<std::string> locales = {"C"};
    /// Directories of the files that installed applications describe themselves with, most important first.
    std::vector<std::filesystem::path> metainfo;
    /// Catalogues beside the machine's: directories with `xml` or `yaml` in them.
    std::vector<std::filesystem::path> catalogues;
    /// The machine's own catalogues, and those of its Flatpak remotes.
    bool usesMachineCatalogues = true;
    /// Where Flatpak keeps what its remotes publish, a directory for each remote.
    std::vector<std::filesystem::path> remotes = {"/var/lib/flatpak/appstream"};
    /// Where catalogues are kept in a form that is quick to search; where everybody keeps them when empty.
    std::filesystem::path cache;
    /// How long an answer waits for catalogues that are still being read. The default is half of what a person who taps
    /// something takes for at once.
    std::chrono::milliseconds patience{50};
    /// The library that reads all of these, as dlopen() wants it.
    std::string library = "libclipsa-linux-appstream.so";

    /// As the user's environment has them.
    static Options ofUser();
};

/// The locales of LANGUAGE, then of the first of LC_ALL, LC_MESSAGES and LANG that is set: without codesets, each once.
/// They end at English, which is among them only when it is the first: texts are written in it, and each language more may
/// be all catalogues once more. A language goes without saying behind one of its own locales.
std::vector<std::string> preferredLocales(const base::Environment& environment);

} // namespace storefront

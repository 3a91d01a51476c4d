/// Somebody who knows applications, and what he knows of one.
///
/// Sources come from a library that is loaded when the first is needed. Each lives on a worker of the service's: it is
/// made, used and destroyed there.
#pragma once

#include "base/Log.h"
#include "linux/storefront/Options.h"

#include <optional>
#include <string>
#include <vector>

namespace storefront {

/// What is not known is nothing. Addresses are of the web.
struct Facts {
    std::optional<std::string> name;
    std::optional<std::string> developer;
    std::optional<std::string> page; ///< in the public form of a store
    std::optional<std::string> homepage;
    std::optional<std::vector<std::string>> genres;
};

class Source {
public:
    virtual ~Source() = default;

    /// Reads what look-ups will need; once is enough.
    virtual void load() = 0;
    /// Nothing when the application is not known. Texts are in the user's languages, or else as they were written.
    virtual std::optional<Facts> find(const std::string& identifier, bool inUsersLanguages) = 0;
    /// Says on the log, once, when something was not found and nothing could be read. It takes a while: for the time
    /// behind an answer.
    virtual void review() = 0;
};

/// What the library exports: makers of sources, of options and a log that outlive them. The caller owns what is made.
using MakeSource = Source* (*)(const Options& options, base::Log& log);
/// What installed applications say of themselves; quick.
inline constexpr const char* kMakeInstalledSource = "clipsaMakeInstalledSource";
/// The catalogues; may take seconds where nobody has read them before.
inline constexpr const char* kMakePublishedSource = "clipsaMakePublishedSource";

} // namespace storefront

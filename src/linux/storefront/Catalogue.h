/// What is known of applications, by whatever reads it: a library that is loaded when it is first needed.
///
/// Lives on the service's worker: it is made, used and destroyed there.
#pragma once

#include "base/Log.h"
#include "linux/storefront/Options.h"
#include "platform/storefront/StoreLookup.h"

#include <optional>
#include <string>

namespace storefront {

class Catalogue {
public:
    virtual ~Catalogue() = default;

    /// Reads what look-ups will need. It may take a second where nobody has read it before; once is enough.
    virtual void load() = 0;
    /// Nothing when nobody knows the application. Texts are in the user's languages, or else as they were written.
    virtual std::optional<platform::StoreItem> find(const std::string& identifier, bool inUsersLanguages) = 0;
    /// Says on the log, once, when something was not found and there are catalogues of which nothing could be read. It
    /// takes a while: for the time behind an answer.
    virtual void review() = 0;
};

/// What the library exports: makes one, of options and a log that outlive it. The caller owns it.
using MakeCatalogue = Catalogue* (*)(const Options& options, base::Log& log);
inline constexpr const char* kMakeCatalogue = "clipsaMakeCatalogue";

} // namespace storefront

/// The languages that the user reads. Any thread.
///
/// Languages and localisations are named alike: "en", "pt-BR", "zh-Hant".
#pragma once

#include <string>
#include <vector>

namespace platform {

class Languages {
public:
    virtual ~Languages() = default;

    /// Most preferred first; never empty.
    virtual std::vector<std::string> preferredLanguages() const = 0;
    /// Those of `localizations` that serve somebody with `preferences`, best first, in their own spelling; none when
    /// that is so.
    virtual std::vector<std::string> preferredLocalizations(const std::vector<std::string>& localizations,
                                                            const std::vector<std::string>& preferences) const = 0;
};

} // namespace platform

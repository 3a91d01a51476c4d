/// The languages that the user reads, by ICU. Any thread.
///
/// Preferred are those of LANGUAGE, in its order, then the first of LC_ALL, LC_MESSAGES and LANG that is set and not empty;
/// English where none of them names a language.
#pragma once

#include "linux/icu/Calendar.h"
#include "platform/files/Languages.h"

namespace intl {

class Languages final : public platform::Languages {
public:
    /// Asks the process's own environment unless given another.
    explicit Languages(const base::Environment& environment = {});

    std::vector<std::string> preferredLanguages() const override { return m_preferred; }
    /// A close relative serves where the language itself is missing: "de" for "de-AT", "pt-BR" for "pt-PT", "zh-Hant" for
    /// "zh-TW". What is no language serves nobody.
    std::vector<std::string> preferredLocalizations(const std::vector<std::string>& localizations,
                                                    const std::vector<std::string>& preferences) const override;

private:
    const std::vector<std::string> m_preferred;
};

} // namespace intl

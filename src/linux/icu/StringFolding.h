/// Comparing text as a reader would, by ICU. Any thread; keeps nothing.
#pragma once

#include "platform/files/StringFolding.h"

namespace intl {

class StringFolding final : public platform::StringFolding {
public:
    /// Bytes that are not UTF-8 are like themselves only. Every text begins with nothing.
    bool hasPrefix(std::string_view text, std::string_view prefix) const override;
};

} // namespace intl

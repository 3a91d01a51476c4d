/// Comparing text as a reader would. Any thread.
#pragma once

#include <string_view>

namespace platform {

class StringFolding {
public:
    virtual ~StringFolding() = default;
    /// Begins-with on canonical forms, ignoring case and diacritics.
    virtual bool hasPrefix(std::string_view text, std::string_view prefix) const = 0;
};

} // namespace platform

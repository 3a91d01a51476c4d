/// Resources that belong together, in the languages that they were translated to: a framework, an application, a
/// directory of one language. Any thread.
#pragma once

#include "platform/files/StringsTable.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

/// Of an Info table: the name that people read, and the short one behind it.
inline constexpr const char* kBundleDisplayNameKey = "CFBundleDisplayName";
inline constexpr const char* kBundleNameKey = "BundleName";

class Bundle {
public:
    virtual ~Bundle() = default;

    virtual const std::string& bundlePath() const = 0;
    /// Empty when it has none.
    virtual std::string bundleIdentifier() const = 0;
    /// Where its resources lie; directories of languages are below it.
    virtual std::string resourcePath() const = 0;
    /// The languages that it has.
    virtual std::vector<std::string> localizations() const = 0;

    /// What its Info table says, and what that says in the user's language.
    virtual StringsTable infoDictionary() const = 0;
    virtual StringsTable localizedInfoDictionary() const = 0;

    /// The file `name.type` of a language; nothing when there is none.
    virtual std::optional<std::string> pathForResource(const std::string& name, const std::string& type,
                                                       const std::string& localization) const = 0;
    /// The text of a table in the user's language; `value` when the table lacks the key, and the key itself when there
    /// is no such value or it is empty.
    virtual std::string localizedString(std::string_view key, const std::optional<std::string>& value,
                                        const std::string& table) const = 0;
};

using BundleRef = std::shared_ptr<const Bundle>;

} // namespace platform

/// What a host hands over: items with a title and attachments, whose contents are loaded when they are asked for.
#pragma once

#include "base/Error.h"
#include "runtime/Value.h"

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

/// The type that everything conforms to.
inline constexpr const char* kGenericDataType = "application/octet-stream";
/// Text, loaded as `std::string`.
inline constexpr const char* kTextType = "text/plain";
/// A colour, loaded as `Color`.
inline constexpr const char* kColorType = "application/x-color";

/// One attachment. Any thread.
class ItemProvider {
public:
    /// The item, or an empty value and why it could not be loaded. Called once, on a thread of the provider's choosing.
    using LoadCompletion = std::function<void(const runtime::Value& item, const base::ErrorRef& error)>;

    virtual ~ItemProvider() = default;

    virtual bool hasItemConformingToTypeIdentifier(std::string_view type) const = 0;
    /// Returns at once. There are no options.
    virtual void loadItemForTypeIdentifier(std::string_view type, LoadCompletion completion) = 0;
};

struct InputItem {
    std::string attributedTitle; ///< its plain text
    std::vector<std::shared_ptr<ItemProvider>> attachments;
};

} // namespace platform

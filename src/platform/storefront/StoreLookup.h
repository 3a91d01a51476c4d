/// The role of the service that knows what an application store says of an application.
#pragma once

#include "base/Error.h"

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace platform {

/// The key profile that asks for what a product's page shows.
inline constexpr const char* kStoreKeyProfileProduct = "product";

struct StoreLookupRequest {
    std::string keyProfile;
    int localizationStyle = 0; ///< 1: in the user's languages
    std::vector<std::string> bundleIdentifiers;
};

/// What the store says of one application; nothing where it does not say it.
struct StoreItem {
    std::optional<std::string> shortProductLink; ///< an address that anybody can open
    std::optional<std::string> displayName;
    std::optional<std::string> artistName; ///< who made it
    std::optional<std::vector<std::string>> genreNames;
};

struct StoreLookupResponse {
    std::vector<StoreItem> results; ///< the best first
};

class StoreLookup {
public:
    /// Without a response there is an error.
    using Callback =
        std::function<void(const std::optional<StoreLookupResponse>& response, const base::ErrorRef& error)>;

    virtual ~StoreLookup() = default;
    /// Returns at once. `callback` runs once, on a thread of the service's; never when the service ends before.
    virtual void start(StoreLookupRequest request, Callback callback) = 0;
};

} // namespace platform

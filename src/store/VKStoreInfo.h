/// What a store knows of an app, with stand-ins where it knew nothing. Filled in by one thread, then handed to another.
#pragma once

#include "runtime/Object.h"

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

/// The keys of the dictionary form.
inline constexpr const char* VKStoreInfoBundleIDKey = "VKStoreInfoBundleIDKey";
inline constexpr const char* VKStoreInfoAppNameKey = "VKStoreInfoAppNameKey";
inline constexpr const char* VKStoreInfoAuthorKey = "VKStoreInfoAuthorKey";
inline constexpr const char* VKStoreInfoItemURLKey = "VKStoreInfoItemURLKey";
inline constexpr const char* VKStoreInfoCategoriesKey = "VKStoreInfoCategoriesKey";

class VKStoreInfo final : public runtime::Object {
public:
    using Text = std::optional<std::string>;
    using Texts = std::optional<std::vector<std::string>>;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }

    /// The identifier that was looked up.
    const Text& bundleID() const { return m_bundleID; }
    /// What the store calls the app; what this device calls it where the store does not.
    const Text& appName() const { return m_appName; }
    /// Who made it; empty where the store does not say.
    const Text& author() const { return m_author; }
    /// The address of its page, as text; empty where there is none.
    const Text& itemURL() const { return m_itemURL; }
    /// The names of its genres; nothing where the store does not say.
    const Texts& categories() const { return m_categories; }

    void setBundleID(Text bundleID) { m_bundleID = std::move(bundleID); }
    void setAppName(Text appName) { m_appName = std::move(appName); }
    void setAuthor(Text author) { m_author = std::move(author); }
    void setItemURL(Text itemURL) { m_itemURL = std::move(itemURL); }
    void setCategories(Texts categories) { m_categories = std::move(categories); }

    /// A new map of what there is, an empty text included; of the genres, only when there are any, with commas and
    /// nothing else between them.
    std::map<std::string, std::string> dictionary() const;

private:
    Text m_bundleID;
    Text m_appName;
    Text m_author;
    Text m_itemURL;
    Texts m_categories;
};

#include "store/VKStoreInfo.h"

namespace {

/// Both accessors of a property.
template <typename T>
void addProperty(runtime::ClassBuilder<VKStoreInfo>& builder, const char* getter, const char* setter,
                 const T& (VKStoreInfo::*get)() const, void (VKStoreInfo::*set)(T))
{
    builder
        .method(getter,
                [get](runtime::Object& self, const runtime::Arguments&) {
                    const auto* const info = dynamic_cast<const VKStoreInfo*>(&self);
                    return info ? runtime::toValue((info->*get)()) : runtime::Value{};
                })
        .method(setter, set);
}

} // namespace

const runtime::Class& VKStoreInfo::classObject()
{
    using Self = VKStoreInfo;
    static const runtime::Class& instance = [&]() -> const runtime::Class& {
        runtime::ClassBuilder<Self> builder("VKStoreInfo", &Object::classObject());
        addProperty(builder, "bundleID", "setBundleID:", &Self::bundleID, &Self::setBundleID);
        addProperty(builder, "appName", "setAppName:", &Self::appName, &Self::setAppName);
        addProperty(builder, "author", "setAuthor:", &Self::author, &Self::setAuthor);
        addProperty(builder, "itemURL", "setItemURL:", &Self::itemURL, &Self::setItemURL);
        addProperty(builder, "categories", "setCategories:", &Self::categories, &Self::setCategories);
        return builder
            .method("dictionary",
                    [](runtime::Object& self, const runtime::Arguments&) {
                        const auto* const info = dynamic_cast<const Self*>(&self);
                        return info ? runtime::toValue(info->dictionary()) : runtime::Value{};
                    })
            .maker([] { return std::make_shared<Self>(); })
            .build();
    }();
    return instance;
}

std::map<std::string, std::string> VKStoreInfo::dictionary() const
{
    std::map<std::string, std::string> dictionary;
    const auto add = [&dictionary](const char* key, const Text& text) {
        if (text)
            dictionary[key] = *text;
    };
    add(VKStoreInfoBundleIDKey, m_bundleID);
    add(VKStoreInfoAppNameKey, m_appName);
    add(VKStoreInfoAuthorKey, m_author);
    add(VKStoreInfoItemURLKey, m_itemURL);
    if (m_categories && !m_categories->empty()) {
        std::string& joined = dictionary[VKStoreInfoCategoriesKey] = m_categories->front();
        for (std::size_t i = 1; i < m_categories->size(); ++i)
            joined += "," + (*m_categories)[i];
    }
    return dictionary;
}

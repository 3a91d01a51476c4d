#include "store/VKStoreManager.h"

#include "base/HandBack.h"
#include "base/Once.h"
#include "support/VKBundleExtensions.h"

#include <utility>

namespace {

/// Of the first result, as the store has it; its fields are nothing when there is none.
platform::StoreItem firstItem(const std::optional<platform::StoreLookupResponse>& response)
{
    return response && !response->results.empty() ? response->results.front() : platform::StoreItem();
}

std::shared_ptr<VKStoreInfo> infoOf(platform::StoreItem item, platform::Bundles& bundles,
                                    const std::string& bundleIdentifier)
{
    auto info = std::make_shared<VKStoreInfo>();
    info->setBundleID(bundleIdentifier);
    info->setItemURL(std::move(item.shortProductLink).value_or(""));
    info->setAppName(item.displayName ? std::move(item.displayName)
                                      : VKExtensions::_vkLocalizedAppNameFromBundleID(bundles, bundleIdentifier));
    info->setAuthor(std::move(item.artistName).value_or(""));
    info->setCategories(std::move(item.genreNames));
    return info;
}

} // namespace

const runtime::Class& VKStoreManager::classObject()
{
    // The services come first, as they do in the call.
    static const runtime::Class& instance =
        runtime::ClassBuilder<VKStoreManager>("VKStoreManager", &Object::classObject())
            .method("loadItemDetailsForBundleIdentifier:completionHandler:",
                    [](runtime::Object& self, const runtime::Arguments& arguments) {
                        auto* const manager = dynamic_cast<VKStoreManager*>(&self);
                        if (!manager || arguments.size() != 3)
                            return runtime::Value{};
                        if (const auto* services = runtime::fromValue<const Services*>(arguments[0]))
                            manager->loadItemDetailsForBundleIdentifier_completionHandler(
                                *services, runtime::fromValue<std::string>(arguments[1]),
                                runtime::fromValue<Completion>(arguments[2]));
                        return runtime::Value{};
                    })
            .build();
    return instance;
}

const std::shared_ptr<VKStoreManager>& VKStoreManager::sharedManager()
{
    static base::Once<std::shared_ptr<VKStoreManager>> manager;
    return manager.get([] { return std::make_shared<VKStoreManager>(); });
}

void VKStoreManager::loadItemDetailsForBundleIdentifier_completionHandler(const Services& services,
                                                                          const std::string& bundleIdentifier,
                                                                          Completion completion)
{
    platform::StoreLookupRequest request;
    request.keyProfile = platform::kStoreKeyProfileProduct;
    request.localizationStyle = 1;
    request.bundleIdentifiers = {bundleIdentifier};
    // Whoever wrote the completion expects it, and what it holds, to end on the main queue, also when it is never called.
    const auto handler =
        base::handedBackTo(services.mainQueue, std::make_shared<const Completion>(std::move(completion)));
    services.lookup.start(std::move(request), [&bundles = services.bundles, &main = services.mainQueue,
                                               bundleIdentifier, handler](const auto& response, const auto&) {
        main.post([handler, info = infoOf(firstItem(response), bundles, bundleIdentifier)] { (*handler)(info); });
    });
}

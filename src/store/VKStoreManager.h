/// Asks the store what it knows of an app. Has no state of its own; any thread.
#pragma once

#include "base/Queue.h"
#include "platform/files/Bundles.h"
#include "platform/storefront/StoreLookup.h"
#include "runtime/Object.h"
#include "store/VKStoreInfo.h"

#include <functional>
#include <memory>
#include <string>

class VKStoreManager final : public runtime::Object {
public:
    using Completion = std::function<void(const std::shared_ptr<VKStoreInfo>& info)>;

    /// What a look-up needs of the platform. It outlives all look-ups.
    struct Services {
        platform::StoreLookup& lookup;
        platform::Bundles& bundles;
        base::MainQueue& mainQueue;
    };

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }

    /// The one that the process has, made when it is first asked for.
    static const std::shared_ptr<VKStoreManager>& sharedManager();

    /// Returns at once; each call is a new request, and nothing is kept. `completion` is called once, on the main queue,
    /// always with a record, whatever became of the request; never when the store does not answer.
    void loadItemDetailsForBundleIdentifier_completionHandler(const Services& services,
                                                              const std::string& bundleIdentifier,
                                                              Completion completion);
};

/// An AppStream store on files of a test's own: catalogues, descriptions of installed applications, and the cache. Main
/// thread only.
#pragma once

#include "base/Log.h"
#include "linux/storefront/AppStreamStore.h"
#include "support/Paths.h"
#include "support/PrivateDirectory.h"

#include <chrono>
#include <future>
#include <gmock/gmock.h>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace tests {

class StoreFixture : public testing::Test {
protected:
    struct Answer {
        std::optional<platform::StoreLookupResponse> response;
        base::ErrorRef error;
    };

    static constexpr const char* kPainter = "org.example.Painter";

    PrivateDirectory files;
    base::MemoryLog log;
    storefront::Options options = privateOptions();
    std::unique_ptr<storefront::AppStreamStore> store;

    storefront::Options privateOptions() const
    {
        storefront::Options made;
        made.metainfo = {files.path() / "home/metainfo", files.path() / "usr/metainfo"};
        made.catalogues = {files.path() / "catalogue"};
        made.usesMachineCatalogues = false;
        made.remotes = {files.path() / "system remotes", files.path() / "user remotes"};
        made.cache = files.path() / "cache";
        made.patience = std::chrono::seconds(60);
        // The sanitizer for addresses opens libraries in our place, and does not look where we would.
        made.library = program(made.library);
        return made;
    }

    /// A catalogue of XML with these components in it.
    void publish(const std::string& name, const std::string& components, const std::string& attributes)
    {
        files.write("catalogue/xml/" + name + ".xml", "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<components "
                                                      "version=\"0.16\" "
                                                          + attributes + ">\n" + components + "</components>\n");
    }
    static std::string component(const std::string& identifier, const std::string& body,
                                 const std::string& kind = "desktop-application")
    {
        return "<component type=\"" + kind + "\"><id>" + identifier + "</id><summary>Something</summary>" + body
               + "</component>\n";
    }
    void install(const std::string& identifier, const std::string& body, const std::string& place = "usr")
    {
        files.write(place + "/metainfo/" + identifier + ".metainfo.xml",
                    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n" + component(identifier, body));
    }

    storefront::AppStreamStore& open()
    {
        if (!store)
            store = std::make_unique<storefront::AppStreamStore>(log, options);
        return *store;
    }
    static platform::StoreLookupRequest requestFor(std::vector<std::string> identifiers)
    {
        return {platform::kStoreKeyProfileProduct, 1, std::move(identifiers)};
    }
    Answer ask(platform::StoreLookupRequest request)
    {
        const auto answered = std::make_shared<std::promise<Answer>>();
        auto answer = answered->get_future();
        open().start(std::move(request), [answered](const auto& response, const auto& error) {
            answered->set_value({response, error});
        });
        if (answer.wait_for(std::chrono::seconds(60)) != std::future_status::ready) {
            ADD_FAILURE() << "nothing was answered";
            return {};
        }
        return answer.get();
    }
    std::vector<platform::StoreItem> resultsFor(const std::string& identifier)
    {
        const Answer answer = ask(requestFor({identifier}));
        EXPECT_TRUE(answer.response) << (answer.error ? answer.error->description() : "");
        EXPECT_FALSE(answer.error);
        return answer.response ? answer.response->results : std::vector<platform::StoreItem>();
    }
    /// The one result; without anything in it when there is none.
    platform::StoreItem itemOf(const std::string& identifier)
    {
        const auto results = resultsFor(identifier);
        EXPECT_THAT(results, testing::SizeIs(1));
        return results.empty() ? platform::StoreItem() : results.front();
    }
    /// Once the store has ended, so that nothing comes any more.
    std::vector<std::string> errors()
    {
        store.reset();
        return log.texts(base::MemoryLog::Line::Kind::Error);
    }
};

} // namespace tests

// Who is asked what, on which thread, and what an answer is made of.
#include "linux/storefront/AppStreamStore.h"

#include <gmock/gmock.h>

#include <future>
#include <map>
#include <mutex>
#include <set>
#include <thread>
#include <utility>

namespace {

using storefront::Facts;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;
using testing::SizeIs;

/// What a fake source was asked, and where; it outlives the source.
struct Witness {
    std::mutex mutex;
    std::vector<std::string> calls;
    std::set<std::thread::id> threads;
    std::map<std::string, Facts> known;
    std::shared_future<void> mayAnswer;
    std::promise<void> asked; ///< for the first time
    bool isAsked = false;
    std::promise<void> reviewed; ///< for the first time
    bool isReviewed = false;

    void saw(const std::string& call)
    {
        const std::lock_guard lock(mutex);
        calls.push_back(call);
        threads.insert(std::this_thread::get_id());
    }
};

class FakeSource final : public storefront::Source {
public:
    explicit FakeSource(Witness& witness) : m_witness(witness) { m_witness.saw("made"); }
    ~FakeSource() override { m_witness.saw("gone"); }
    void load() override { m_witness.saw("load"); }
    std::optional<Facts> find(const std::string& identifier, bool inUsersLanguages) override
    {
        m_witness.saw(identifier + (inUsersLanguages ? " translated" : " as written"));
        if (!std::exchange(m_witness.isAsked, true))
            m_witness.asked.set_value();
        if (m_witness.mayAnswer.valid())
            m_witness.mayAnswer.wait();
        const auto found = m_witness.known.find(identifier);
        return found == m_witness.known.end() ? std::nullopt : std::optional(found->second);
    }
    void review() override
    {
        m_witness.saw("review");
        if (!std::exchange(m_witness.isReviewed, true))
            m_witness.reviewed.set_value();
    }

private:
    Witness& m_witness;
};

class StoreService : public testing::Test {
protected:
    base::MemoryLog log;
    storefront::Options options;
    Witness installed, published;
    bool hasInstalled = true, hasPublished = true;
    std::unique_ptr<storefront::AppStreamStore> store;

    StoreService() { options.patience = std::chrono::seconds(60); }

    void open()
    {
        const auto make = [](Witness& witness, bool exists) {
            return [&witness, exists] { return exists ? std::make_unique<FakeSource>(witness) : nullptr; };
        };
        store = std::make_unique<storefront::AppStreamStore>(
            log, options,
            storefront::AppStreamStore::Makers{make(installed, hasInstalled), make(published, hasPublished)});
    }
    std::future<std::optional<platform::StoreLookupResponse>> ask(std::vector<std::string> identifiers, int style = 1)
    {
        if (!store)
            open();
        const auto answer = std::make_shared<std::promise<std::optional<platform::StoreLookupResponse>>>();
        auto future = answer->get_future();
        store->start({platform::kStoreKeyProfileProduct, style, std::move(identifiers)},
                     [answer](const auto& response, const auto&) { answer->set_value(response); });
        return future;
    }
    platform::StoreItem itemOf(const std::string& identifier)
    {
        const auto response = ask({identifier}).get();
        EXPECT_TRUE(response && response->results.size() == 1);
        return response && !response->results.empty() ? response->results.front() : platform::StoreItem();
    }
};

TEST_F(StoreService, NothingIsMadeBeforeItIsNeeded)
{
    open();
    store.reset();
    EXPECT_THAT(installed.calls, IsEmpty());
    EXPECT_THAT(published.calls, IsEmpty());
}

TEST_F(StoreService, PreparingLoadsBothAndALookupAsksBoth)
{
    open();
    store->prepare();
    ask({"a", "b"}).get();
    published.reviewed.get_future().wait();
    store.reset();
    EXPECT_THAT(installed.calls, ElementsAre("made", "load", "a translated", "b translated", "gone"));
    EXPECT_THAT(published.calls, ElementsAre("made", "load", "a translated", "b translated", "review", "gone"));
}

TEST_F(StoreService, EachSourceHasAThreadOfItsOwn)
{
    open();
    store->prepare();
    std::promise<std::thread::id> answeredOn;
    store->start({platform::kStoreKeyProfileProduct, 1, {"a"}},
                 [&](const auto&, const auto&) { answeredOn.set_value(std::this_thread::get_id()); });
    const std::thread::id answering = answeredOn.get_future().get();
    published.reviewed.get_future().wait();
    store.reset();
    EXPECT_THAT(installed.threads, ElementsAre(answering));
    EXPECT_THAT(published.threads, SizeIs(1));
    EXPECT_FALSE(published.threads.contains(answering));
    EXPECT_FALSE(published.threads.contains(std::this_thread::get_id()));
}

TEST_F(StoreService, TheStyleSaysWhetherTextsAreTranslated)
{
    ask({"a"}, 0).get();
    store.reset();
    EXPECT_THAT(installed.calls, testing::Contains("a as written"));
    EXPECT_THAT(published.calls, testing::Contains("a as written"));
}

TEST_F(StoreService, WhatIsInstalledGoesFirstAndTheCataloguesSayTheRest)
{
    installed.known["a"] = {"Mine", std::nullopt, std::nullopt, "https://mine", std::nullopt};
    published.known["a"] = {"Theirs", "Developer", std::nullopt, "https://theirs", {{"Genre"}}};
    const platform::StoreItem item = itemOf("a");
    EXPECT_THAT(item.displayName, Optional(std::string("Mine")));
    EXPECT_THAT(item.artistName, Optional(std::string("Developer")));
    EXPECT_THAT(item.shortProductLink, Optional(std::string("https://mine")));
    EXPECT_THAT(item.genreNames, Optional(ElementsAre("Genre")));
}

TEST_F(StoreService, APublicPageGoesBeforeAnyHomepage)
{
    installed.known["a"].homepage = "https://mine";
    published.known["a"].page = "https://page";
    EXPECT_THAT(itemOf("a").shortProductLink, Optional(std::string("https://page")));
}

TEST_F(StoreService, WhatOneOfThemKnowsIsKnown)
{
    installed.known["a"].name = "A";
    published.known["b"].name = "B";
    const auto response = ask({"b", "c", "a"}).get();
    ASSERT_TRUE(response);
    ASSERT_THAT(response->results, SizeIs(2));
    EXPECT_THAT(response->results[0].displayName, Optional(std::string("B")));
    EXPECT_THAT(response->results[1].displayName, Optional(std::string("A")));
}

TEST_F(StoreService, AnAnswerDoesNotWaitForCataloguesLongerThanPatienceAllows)
{
    std::promise<void> mayAnswer;
    published.mayAnswer = mayAnswer.get_future().share();
    installed.known["a"] = {"Mine", std::nullopt, std::nullopt, "https://mine", std::nullopt};
    published.known["a"] = {"Theirs", "Developer", "https://page", std::nullopt, std::nullopt};
    options.patience = std::chrono::milliseconds(1);
    const platform::StoreItem item = itemOf("a");
    EXPECT_THAT(item.displayName, Optional(std::string("Mine")));
    EXPECT_EQ(item.artistName, std::nullopt);
    EXPECT_THAT(item.shortProductLink, Optional(std::string("https://mine")));
    EXPECT_THAT(ask({"b"}).get()->results, IsEmpty()) << "the next does not wait either";
    mayAnswer.set_value();
    store.reset();
    EXPECT_THAT(installed.calls, ElementsAre("made", "a translated", "b translated", "gone"));
}

TEST_F(StoreService, WithoutCataloguesWhatIsInstalledIsTheAnswer)
{
    hasPublished = false;
    installed.known["a"].name = "Mine";
    open();
    store->prepare();
    EXPECT_THAT(itemOf("a").displayName, Optional(std::string("Mine")));
    EXPECT_THAT(itemOf("a").displayName, Optional(std::string("Mine"))) << "also behind the first answer";
    store.reset();
}

TEST_F(StoreService, WithoutASourceThereIsNoResponse)
{
    hasInstalled = false;
    EXPECT_FALSE(ask({"a"}).get());
    EXPECT_FALSE(ask({"a"}).get());
    store.reset();
    EXPECT_THAT(published.calls, IsEmpty());
}

TEST_F(StoreService, AnUnknownProfileIsAnsweredWithAnErrorAndAsksNobody)
{
    open();
    std::promise<base::ErrorRef> answered;
    store->start({"lockup", 1, {"a"}}, [&](const auto& response, const base::ErrorRef& error) {
        EXPECT_FALSE(response);
        answered.set_value(error);
    });
    const base::ErrorRef error = answered.get_future().get();
    ASSERT_TRUE(error);
    EXPECT_EQ(error->domain(), storefront::kStoreErrorDomain);
    EXPECT_EQ(error->code(), storefront::kStoreBadRequest);
    store.reset();
    EXPECT_THAT(installed.calls, IsEmpty());
}

TEST_F(StoreService, WhatIsFoundAfterTheEndIsToldToNobody)
{
    std::promise<void> mayAnswer;
    installed.mayAnswer = mayAnswer.get_future().share();
    open();
    store->start({platform::kStoreKeyProfileProduct, 1, {"a"}},
                 [](const auto&, const auto&) { FAIL() << "it had ended"; });
    installed.asked.get_future().wait();
    store->end();
    mayAnswer.set_value();
    store.reset();
    EXPECT_THAT(installed.calls, testing::Contains("a translated"));
}

TEST_F(StoreService, AfterTheEndNobodyIsAskedOrAnswered)
{
    ask({"a"}).get();
    published.reviewed.get_future().wait();
    store->end();
    store->prepare();
    store->start({platform::kStoreKeyProfileProduct, 1, {"b"}},
                 [](const auto&, const auto&) { FAIL() << "it had ended"; });
    store.reset();
    EXPECT_THAT(installed.calls, ElementsAre("made", "a translated", "gone"));
    EXPECT_THAT(published.calls, ElementsAre("made", "a translated", "review", "gone"));
}

} // namespace

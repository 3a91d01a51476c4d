#include "store/VKStoreManager.h"

#include "support/FakeBundles.h"
#include "support/FakeStoreLookup.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <memory>
#include <string>
#include <thread>
#include <vector>

namespace {

using platform::StoreItem;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;
using testing::Pair;
using testing::SizeIs;
using testing::UnorderedElementsAre;

class StoreManager : public testing::Test {
protected:
    static constexpr const char* kApp = "org.example.App";

    tests::TestSystem machine;
    tests::FakeBundles bundles;
    tests::FakeStoreLookup store;
    const VKStoreManager::Services services{store, bundles, machine.mainQueue};
    std::vector<std::shared_ptr<VKStoreInfo>> told;
    std::thread::id toldOn;

    VKStoreManager::Completion completion()
    {
        return [this](const std::shared_ptr<VKStoreInfo>& info) {
            told.push_back(info);
            toldOn = std::this_thread::get_id();
        };
    }
    void load(const std::string& identifier = kApp)
    {
        VKStoreManager::sharedManager()->loadItemDetailsForBundleIdentifier_completionHandler(services, identifier,
                                                                                              completion());
    }
    /// What is told when the store answers with `results`.
    VKStoreInfo& infoOf(std::vector<StoreItem> results)
    {
        load();
        store.answer(std::move(results));
        machine.drain();
        return lastTold();
    }
    VKStoreInfo& lastTold()
    {
        static VKStoreInfo nothing;
        EXPECT_THAT(told, testing::Not(IsEmpty()));
        return told.empty() ? nothing : *told.back();
    }
    void installed(const char* identifier, const char* localizedName)
    {
        const auto app = bundles.add("/apps/" + std::string(identifier));
        app->identifier = identifier;
        app->localizedInfo[platform::kBundleDisplayNameKey] = localizedName;
    }
    static StoreItem painter() { return {"https://store/painter", "Painter", "Ada", {{"Graphics", "Fun"}}}; }
};

TEST_F(StoreManager, AKnownAppHasAllFiveValues)
{
    const VKStoreInfo& info = infoOf({painter()});
    EXPECT_THAT(info.bundleID(), Optional(std::string(kApp)));
    EXPECT_THAT(info.appName(), Optional(std::string("Painter")));
    EXPECT_THAT(info.author(), Optional(std::string("Ada")));
    EXPECT_THAT(info.itemURL(), Optional(std::string("https://store/painter")));
    EXPECT_THAT(info.categories(), Optional(ElementsAre("Graphics", "Fun")));
}

TEST_F(StoreManager, TheDictionaryOfAKnownAppHasFiveEntriesWithTheGenresInOne)
{
    EXPECT_THAT(infoOf({painter()}).dictionary(),
                UnorderedElementsAre(Pair("VKStoreInfoBundleIDKey", kApp), Pair("VKStoreInfoAppNameKey", "Painter"),
                                     Pair("VKStoreInfoAuthorKey", "Ada"),
                                     Pair("VKStoreInfoItemURLKey", "https://store/painter"),
                                     Pair("VKStoreInfoCategoriesKey", "Graphics,Fun")));
}

TEST_F(StoreManager, AnUnknownAppHasTheNameThatThisDeviceHasForIt)
{
    installed(kApp, "Maler");
    const VKStoreInfo& info = infoOf({});
    EXPECT_THAT(info.bundleID(), Optional(std::string(kApp)));
    EXPECT_THAT(info.appName(), Optional(std::string("Maler")));
    EXPECT_THAT(info.author(), Optional(std::string()));
    EXPECT_THAT(info.itemURL(), Optional(std::string()));
    EXPECT_EQ(info.categories(), std::nullopt);
    EXPECT_THAT(info.dictionary(),
                UnorderedElementsAre(Pair(VKStoreInfoBundleIDKey, kApp), Pair(VKStoreInfoAppNameKey, "Maler"),
                                     Pair(VKStoreInfoAuthorKey, ""), Pair(VKStoreInfoItemURLKey, "")));
}

TEST_F(StoreManager, AnAppThatNobodyKnowsHasNoName)
{
    const VKStoreInfo& info = infoOf({});
    EXPECT_EQ(info.appName(), std::nullopt);
    EXPECT_THAT(info.dictionary(),
                UnorderedElementsAre(Pair(VKStoreInfoBundleIDKey, kApp), Pair(VKStoreInfoAuthorKey, ""),
                                     Pair(VKStoreInfoItemURLKey, "")));
}

TEST_F(StoreManager, TheStoresNameGoesBeforeTheDevices)
{
    installed(kApp, "Maler");
    EXPECT_THAT(infoOf({painter()}).appName(), Optional(std::string("Painter")));
}

TEST_F(StoreManager, AnEmptyListOfGenresIsNotInTheDictionary)
{
    StoreItem item = painter();
    item.genreNames = std::vector<std::string>();
    const VKStoreInfo& info = infoOf({item});
    EXPECT_THAT(info.categories(), Optional(IsEmpty()));
    EXPECT_FALSE(info.dictionary().contains(VKStoreInfoCategoriesKey));
    EXPECT_THAT(info.dictionary(), SizeIs(4));
}

TEST_F(StoreManager, OneGenreHasNoComma)
{
    StoreItem item = painter();
    item.genreNames = {"Games"};
    EXPECT_EQ(infoOf({item}).dictionary().at(VKStoreInfoCategoriesKey), "Games");
}

TEST_F(StoreManager, OfSeveralResultsTheFirstIsTaken)
{
    const StoreItem silent{{}, {}, {}, {}};
    const VKStoreInfo& info = infoOf({silent, painter()});
    EXPECT_EQ(info.appName(), std::nullopt) << "what the first lacks is not taken from the second";
    EXPECT_THAT(info.author(), Optional(std::string()));
    EXPECT_THAT(infoOf({painter(), silent}).author(), Optional(std::string("Ada")));
}

TEST_F(StoreManager, WithoutAResponseThereIsARecordAllTheSame)
{
    installed(kApp, "Maler");
    load();
    store.fail(base::Error::make("store", 1, "no network"));
    machine.drain();
    ASSERT_THAT(told, SizeIs(1));
    EXPECT_THAT(lastTold().appName(), Optional(std::string("Maler")));
    EXPECT_THAT(lastTold().itemURL(), Optional(std::string()));
}

TEST_F(StoreManager, AsksForOneProductInTheUsersLanguages)
{
    load("org.example.One");
    ASSERT_THAT(store.requests, SizeIs(1));
    EXPECT_EQ(store.requests[0].keyProfile, "product");
    EXPECT_EQ(store.requests[0].localizationStyle, 1);
    EXPECT_THAT(store.requests[0].bundleIdentifiers, ElementsAre("org.example.One"));
}

TEST_F(StoreManager, TheCompletionRunsOnceAndOnTheMainQueue)
{
    load();
    EXPECT_THAT(told, IsEmpty()) << "the store has not answered";
    store.answer({painter()});
    EXPECT_NE(store.answeredOn, std::this_thread::get_id());
    EXPECT_THAT(told, IsEmpty()) << "it did not wait for the main queue";
    machine.drain();
    EXPECT_THAT(told, SizeIs(1));
    EXPECT_EQ(toldOn, std::this_thread::get_id());
}

TEST_F(StoreManager, ASecondLookupIsASecondRequest)
{
    infoOf({painter()});
    infoOf({});
    EXPECT_THAT(store.requests, SizeIs(2));
    ASSERT_THAT(told, SizeIs(2));
    EXPECT_THAT(told[0]->author(), Optional(std::string("Ada")));
    EXPECT_THAT(told[1]->author(), Optional(std::string())) << "something was kept of the first";
    EXPECT_NE(told[0], told[1]);
}

TEST_F(StoreManager, WhatTheCompletionHoldsEndsOnTheMainQueueThoughNoAnswerComes)
{
    std::thread::id endedOn;
    {
        const auto held = std::shared_ptr<int>(new int(1), [&endedOn](const int* value) {
            delete value;
            endedOn = std::this_thread::get_id();
        });
        VKStoreManager::sharedManager()->loadItemDetailsForBundleIdentifier_completionHandler(
            services, kApp, [held](const auto&) { FAIL() << "nothing was answered"; });
    }
    store.end();
    EXPECT_EQ(endedOn, std::thread::id()) << "it ended with the store, on the store's thread";
    machine.drain();
    EXPECT_EQ(endedOn, std::this_thread::get_id());
}

TEST_F(StoreManager, IsOneForTheProcess)
{
    const auto first = VKStoreManager::sharedManager();
    ASSERT_TRUE(first);
    EXPECT_EQ(VKStoreManager::sharedManager(), first);
    std::shared_ptr<VKStoreManager> elsewhere;
    std::thread([&] { elsewhere = VKStoreManager::sharedManager(); }).join();
    EXPECT_EQ(elsewhere, first);
}

TEST_F(StoreManager, CanBeSentAMessage)
{
    const runtime::Selector load("loadItemDetailsForBundleIdentifier:completionHandler:");
    const auto manager = VKStoreManager::sharedManager();
    ASSERT_TRUE(manager->respondsTo(load));
    manager->perform(load, {&services, std::string(kApp), completion()});
    ASSERT_TRUE(store.isBusy());
    EXPECT_THAT(store.requests.back().bundleIdentifiers, ElementsAre(kApp));
    store.answer({painter()});
    machine.drain();
    EXPECT_THAT(lastTold().appName(), Optional(std::string("Painter")));

    manager->perform(load);
    manager->perform(load, {std::string(kApp), completion(), 1});
    EXPECT_FALSE(store.isBusy()) << "who asks nobody gets no answer";
}

TEST(StoreInfo, ValuesAreReadAndSetByMessage)
{
    const runtime::Class* known = nullptr;
    VKStoreInfo::classObject();
    known = runtime::Class::named("VKStoreInfo");
    ASSERT_TRUE(known);
    const auto info = std::dynamic_pointer_cast<VKStoreInfo>(known->instantiate());
    ASSERT_TRUE(info);
    EXPECT_THAT(info->dictionary(), IsEmpty()) << "what is nothing is not stored";

    using Text = VKStoreInfo::Text;
    for (const auto& [get, set] : {std::pair{"bundleID", "setBundleID:"},
                                   {"appName", "setAppName:"},
                                   {"author", "setAuthor:"},
                                   {"itemURL", "setItemURL:"}}) {
        info->perform(runtime::Selector(set), {Text(get)});
        EXPECT_EQ(runtime::fromValue<Text>(info->perform(runtime::Selector(get))), get);
    }
    info->perform(runtime::Selector("setCategories:"), {VKStoreInfo::Texts({"a", "b"})});
    EXPECT_THAT(runtime::fromValue<VKStoreInfo::Texts>(info->perform(runtime::Selector("categories"))),
                Optional(ElementsAre("a", "b")));
    using Dictionary = std::map<std::string, std::string>;
    const auto dictionary = runtime::fromValue<Dictionary>(info->perform(runtime::Selector("dictionary")));
    EXPECT_EQ(dictionary, info->dictionary());
    EXPECT_EQ(dictionary.at(VKStoreInfoItemURLKey), "itemURL");
}

} // namespace

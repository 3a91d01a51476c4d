// What the host hands over, item by item, and the editors that are built of it.
#include "ExtensionFixture.h"

namespace {

class InputItems : public ExtensionTest {};

} // namespace

TEST_F(InputItems, TheKeysAreTheTextsThatHostsUse)
{
    EXPECT_STREQ(VKVideoEditorExtensionMoviePathKey, "VKVideoEditorExtensionMovieURLKey");
    EXPECT_STREQ(VKVideoEditorExtensionAppNameKey, "VKVideoEditorExtensionAppNameKey");
    EXPECT_STREQ(VKVideoEditorExtensionBundleIdentifierKey, "VKVideoEditorExtensionBundleIdentifierKey");
    EXPECT_STREQ(VKVideoEditorExtensionFileAttachmentKey, "VKVideoEditorExtensionFileAttachmentKey");
    EXPECT_STREQ(VKVideoEditorExtensionOverrideShareMessageKey, "VKVideoEditorExtensionOverrideShareMessageKey");
    EXPECT_STREQ(VKVideoEditorExtensionOverrideTintColorKey, "VKVideoEditorExtensionOverrideTintColorKey");
}

TEST_F(InputItems, TheThreeRequiredItemsAloneBuildOneEditorWithoutTheOptionalValues)
{
    offerRequired();
    start();
    int calls = 0;
    controller->inputItemsFromClientWithCompletionHandler([&](const auto& bundleIdentifier, const auto& appName,
                                                              const auto& movieURL, const auto& attachment,
                                                              const auto& message, const auto& tint) {
        ++calls;
        EXPECT_EQ(bundleIdentifier, "org.example.Game");
        EXPECT_EQ(appName, "Game");
        EXPECT_EQ(movieURL, base::Url::fromPath(kMovie));
        EXPECT_EQ(attachment, std::nullopt);
        EXPECT_EQ(message, std::nullopt);
        EXPECT_EQ(tint, std::nullopt);
    });
    deliverRequired();
    EXPECT_EQ(calls, 1);
}

TEST_F(InputItems, TheEditorIsBuiltOnTheMainQueueFromThePayload)
{
    offer(VKVideoEditorExtensionFileAttachmentKey);
    offer(VKVideoEditorExtensionOverrideShareMessageKey);
    offer(VKVideoEditorExtensionOverrideTintColorKey);
    offerRequired();
    start();
    deliver(VKVideoEditorExtensionFileAttachmentKey, std::string("/notes.txt"));
    deliver(VKVideoEditorExtensionOverrideShareMessageKey, std::string("Look"));
    deliver(VKVideoEditorExtensionOverrideTintColorKey, platform::Color{0, 1, 0, 1});
    deliverRequired();
    EXPECT_EQ(controller->appName(), "Game");
    EXPECT_EQ(editor(), nullptr);
    EXPECT_FALSE(logged("loaded input items"));

    fake.machine.mainQueue.drain();
    ASSERT_TRUE(editor());
    EXPECT_TRUE(logged("loaded input items"));
    EXPECT_EQ(fake.media.playerCount(), 1U);
    EXPECT_EQ(editor()->videoURL(), base::Url::fromPath(kMovie));
    EXPECT_EQ(editor()->applicationName(), "Game");
    EXPECT_EQ(editor()->bundleIdentifier(), "org.example.Game");
    EXPECT_EQ(editor()->fileAttachmentURL(), base::Url::fromPath("/notes.txt"));
    EXPECT_EQ(editor()->overrideShareMessage(), "Look");
    EXPECT_EQ(editor()->topToolBar()->tintColor(), (platform::Color{0, 1, 0, 1}));
    EXPECT_EQ(editor()->delegate(), controller);
    EXPECT_EQ(editor()->parent(), controller);
    EXPECT_EQ(editor()->view()->superview(), controller->view());
    EXPECT_EQ(editor()->view()->frame(), controller->view()->bounds());
}

TEST_F(InputItems, AnItemTitledWithTheConstantsNameRatherThanItsTextIsIgnored)
{
    offer("VKVideoEditorExtensionMoviePathKey");
    offer(VKVideoEditorExtensionAppNameKey);
    offer(VKVideoEditorExtensionBundleIdentifierKey);
    start();
    deliver("VKVideoEditorExtensionMoviePathKey", std::string(kMovie));
    deliver(VKVideoEditorExtensionAppNameKey, std::string("Game"));
    deliver(VKVideoEditorExtensionBundleIdentifierKey, std::string("org.example.Game"));
    fake.machine.mainQueue.drain();
    EXPECT_EQ(editor(), nullptr);
}

TEST_F(InputItems, TitlesAreComparedExactly)
{
    offer("vkvideoeditorextensionappnamekey");
    offer("VKVideoEditorExtensionAppNameKey ");
    start();
    deliver("vkvideoeditorextensionappnamekey", std::string("lower"));
    deliver("VKVideoEditorExtensionAppNameKey ", std::string("space"));
    EXPECT_EQ(controller->appName(), std::nullopt);
}

TEST_F(InputItems, OptionalItemsThatComeLateBuildFurtherEditors)
{
    offerRequired();
    offer(VKVideoEditorExtensionOverrideShareMessageKey);
    offer(VKVideoEditorExtensionFileAttachmentKey);
    start();
    deliverRequired();
    fake.machine.mainQueue.drain();
    const auto first = editor();
    deliver(VKVideoEditorExtensionOverrideShareMessageKey, std::string("Look"));
    fake.machine.mainQueue.drain();
    EXPECT_NE(editor(), first);
    EXPECT_EQ(editor()->overrideShareMessage(), "Look");
    deliver(VKVideoEditorExtensionFileAttachmentKey, std::string("/notes.txt"));
    fake.machine.mainQueue.drain();
    EXPECT_EQ(editor()->fileAttachmentURL(), base::Url::fromPath("/notes.txt"));
    EXPECT_EQ(fake.media.playerCount(), 3U);
    // Replaced, not detached.
    EXPECT_EQ(controller->childViewControllers().size(), 3U);
    EXPECT_EQ(first->parent(), controller);
}

TEST_F(InputItems, AFailedItemIsLoggedAndDoesNotStopTheOthers)
{
    offer(VKVideoEditorExtensionOverrideShareMessageKey);
    offerRequired();
    offer(VKVideoEditorExtensionFileAttachmentKey);
    offer(VKVideoEditorExtensionOverrideTintColorKey);
    start();
    const auto linesOf = [&](const std::string& title) {
        return std::vector<base::MemoryLog::Line>{
            {base::MemoryLog::Line::Kind::Error, "Error loading input item for type"},
            {base::MemoryLog::Line::Kind::Console, title + ": gone"}};
    };
    const auto fails = [&](const std::string& title) {
        const auto before = fake.machine.log.lines().size();
        deliver(title, std::string("half of it"), base::Error::make("test", 7, "gone"));
        const auto lines = fake.machine.log.lines();
        return std::vector(lines.begin() + static_cast<std::ptrdiff_t>(before), lines.end());
    };
    EXPECT_EQ(fails(VKVideoEditorExtensionOverrideShareMessageKey),
              linesOf(VKVideoEditorExtensionOverrideShareMessageKey));
    deliverRequired();
    fake.machine.mainQueue.drain();
    const auto first = editor();
    ASSERT_TRUE(first);

    // What fails when all that is required is there brings no editor; what comes after it does.
    EXPECT_EQ(fails(VKVideoEditorExtensionFileAttachmentKey), linesOf(VKVideoEditorExtensionFileAttachmentKey));
    fake.machine.mainQueue.drain();
    EXPECT_EQ(editor(), first);
    EXPECT_EQ(fake.media.playerCount(), 1U);
    deliver(VKVideoEditorExtensionOverrideTintColorKey, platform::Color{0, 1, 0, 1});
    fake.machine.mainQueue.drain();
    EXPECT_EQ(fake.media.playerCount(), 2U);
    EXPECT_EQ(editor()->topToolBar()->tintColor(), (platform::Color{0, 1, 0, 1}));
    EXPECT_EQ(editor()->overrideShareMessage(), std::nullopt);
    EXPECT_EQ(editor()->fileAttachmentURL(), std::nullopt);
}

TEST_F(InputItems, WithoutARequiredValueThePayloadBuildsNoEditor)
{
    offerRequired();
    start();
    deliver(VKVideoEditorExtensionMoviePathKey, std::string(kMovie));
    deliver(VKVideoEditorExtensionAppNameKey, std::string("Game"));
    deliver(VKVideoEditorExtensionBundleIdentifierKey, {}, base::Error::make("test", 7, "gone"));
    fake.machine.mainQueue.drain();
    EXPECT_EQ(editor(), nullptr);
}

TEST_F(InputItems, ItemsWithoutAttachmentsOrOfAnotherTypeAreSkippedInSilence)
{
    items.push_back({VKVideoEditorExtensionAppNameKey, {}});
    items.push_back({VKVideoEditorExtensionAppNameKey, {std::make_shared<ScriptedProvider>(false)}});
    offerRequired();
    start();
    deliverRequired();
    fake.machine.mainQueue.drain();
    EXPECT_TRUE(editor());
    EXPECT_TRUE(fake.machine.log.texts(base::MemoryLog::Line::Kind::Error).empty());
}

TEST_F(InputItems, OnlyTheFirstAttachmentCounts)
{
    const auto first = std::make_shared<ScriptedProvider>();
    const auto second = std::make_shared<ScriptedProvider>();
    items.push_back({VKVideoEditorExtensionAppNameKey, {first, second}});
    start();
    EXPECT_TRUE(first->isLoading());
    EXPECT_FALSE(second->isLoading());
}

TEST_F(InputItems, ValuesOfTheWrongKindAreAsGoodAsNone)
{
    offerRequired();
    offer(VKVideoEditorExtensionOverrideTintColorKey);
    start();
    deliver(VKVideoEditorExtensionOverrideTintColorKey, std::string("red"));
    deliver(VKVideoEditorExtensionMoviePathKey, 42);
    deliver(VKVideoEditorExtensionAppNameKey, std::vector<int>{1, 2});
    deliver(VKVideoEditorExtensionBundleIdentifierKey, std::string("org.example.Game"));
    fake.machine.mainQueue.drain();
    EXPECT_EQ(editor(), nullptr);
}

TEST_F(InputItems, TheLoadThatCompletesTheRequiredValuesStopsTheEnumeration)
{
    const auto late = std::make_shared<ImmediateProvider>(std::string("Look"));
    items.push_back({VKVideoEditorExtensionMoviePathKey, {std::make_shared<ImmediateProvider>(std::string(kMovie))}});
    items.push_back({VKVideoEditorExtensionAppNameKey, {std::make_shared<ImmediateProvider>(std::string("Game"))}});
    items.push_back(
        {VKVideoEditorExtensionBundleIdentifierKey, {std::make_shared<ImmediateProvider>(std::string("x"))}});
    items.push_back({VKVideoEditorExtensionOverrideShareMessageKey, {late}});
    start();
    EXPECT_EQ(late->loads, 0);
}

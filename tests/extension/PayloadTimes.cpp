// When the items of the payload come: at the same time, twice, or when nobody waits for them any more.
#include "ExtensionFixture.h"

#include <gmock/gmock.h>

#include <optional>

namespace {

using testing::ElementsAre;
using testing::Optional;

constexpr const char* kMessage = VKVideoEditorExtensionOverrideShareMessageKey;
constexpr const char* kAttachment = VKVideoEditorExtensionFileAttachmentKey;
constexpr const char* kTint = VKVideoEditorExtensionOverrideTintColorKey;

class PayloadTimes : public ExtensionTest {
protected:
    /// The values that the controller has, those without a value as "-".
    std::vector<std::string> kept() const
    {
        const auto path = [](const std::optional<base::Url>& url) { return url ? url->path() : "-"; };
        return {controller->bundleIdentifier().value_or("-"), controller->appName().value_or("-"),
                path(controller->movieURL()), path(controller->fileAttachmentURL()),
                controller->overrideShareMessage().value_or("-")};
    }
};

} // namespace

TEST_F(PayloadTimes, ALoadThatEndsWhileAnotherIsToldOfIsToldOfAfterIt)
{
    offerRequired();
    offer(kMessage);
    offer(kAttachment);
    start();
    std::vector<std::pair<std::optional<std::string>, std::optional<base::Url>>> told;
    bool first = true;
    controller->inputItemsFromClientWithCompletionHandler(
        [&](const auto&, const auto&, const auto&, const auto& attachment, const auto& message, const auto&) {
            // Two more loads end, on threads of their own, before these values are put in their place.
            if (std::exchange(first, false)) {
                deliver(kMessage, std::string("Look"));
                deliver(kAttachment, std::string("/notes.txt"));
            }
            told.emplace_back(message, attachment);
        });
    deliverRequired();
    EXPECT_EQ(told,
              (decltype(told){
                  {std::nullopt, std::nullopt}, {"Look", std::nullopt}, {"Look", base::Url::fromPath("/notes.txt")}}));
}

TEST_F(PayloadTimes, AnEmptyItemKeepsTheOlderValue)
{
    std::vector<std::shared_ptr<ScriptedProvider>> again;
    offerRequired();
    for (const char* title : {kMessage, kAttachment, kTint})
        offer(title);
    for (const platform::InputItem& item : std::vector(items)) {
        again.push_back(std::make_shared<ScriptedProvider>());
        items.push_back({item.attributedTitle, {again.back()}});
    }
    start();
    deliverRequired();
    deliver(kMessage, std::string("Look"));
    deliver(kAttachment, std::string("/notes.txt"));
    deliver(kTint, platform::Color{0, 1, 0, 1});
    for (const auto& provider : again)
        provider->deliver({});
    EXPECT_THAT(kept(), ElementsAre("org.example.Game", "Game", kMovie, "/notes.txt", "Look"));
    EXPECT_THAT(controller->overrideTintColor(), Optional(platform::Color{0, 1, 0, 1}));

    // An empty text is one.
    again[3]->deliver(std::string());
    EXPECT_THAT(controller->overrideShareMessage(), Optional(std::string()));
}

TEST_F(PayloadTimes, APayloadThatComesWhenTheWindowIsOpenIsShownInPlaceOfNothing)
{
    offerRequired();
    start();
    show();
    const auto ofNothing = editor();
    deliverRequired();
    EXPECT_EQ(editor(), ofNothing);
    fake.machine.mainQueue.drain();
    ASSERT_NE(editor(), ofNothing);
    EXPECT_EQ(editor()->videoURL(), base::Url::fromPath(kMovie));
    EXPECT_TRUE(ofNothing->view()->isHidden());
    EXPECT_FALSE(editor()->view()->isHidden());
}

TEST_F(PayloadTimes, APayloadThatComesAfterDisappearingIsWhatTheNextAppearanceShows)
{
    offerRequired();
    start();
    show();
    fake.window->setVisible(false);
    deliverRequired();
    fake.machine.mainQueue.drain();
    const auto late = editor();
    ASSERT_TRUE(late);
    fake.window->setVisible(true);
    EXPECT_EQ(editor(), late);
    EXPECT_EQ(late->videoURL(), base::Url::fromPath(kMovie));
    EXPECT_EQ(controller->childViewControllers().size(), 1U);
}

TEST_F(PayloadTimes, LoadsDoNotKeepTheControllerAndWhatComesAfterItsEndBuildsNothing)
{
    offerRequired();
    start();
    const std::weak_ptr<VKVideoEditorExtensionViewController> weak = controller;
    controller.reset();
    ASSERT_TRUE(weak.expired());
    deliverRequired();
    fake.machine.mainQueue.drain();
    EXPECT_EQ(fake.media.playerCount(), 0U);
    EXPECT_FALSE(logged("loaded input items"));
}

TEST_F(PayloadTimes, AnEditorThatIsDueDoesNotKeepTheController)
{
    offerRequired();
    start();
    deliverRequired();
    const std::weak_ptr<VKVideoEditorExtensionViewController> weak = controller;
    controller.reset();
    ASSERT_TRUE(weak.expired());
    fake.machine.mainQueue.drain();
    EXPECT_EQ(fake.media.playerCount(), 0U);
}

TEST_F(PayloadTimes, TheValuesAreThereBeforeTheMainQueueIsAskedToShowThem)
{
    offerRequired();
    start();
    std::vector<std::string> atTheCall;
    fake.machine.mainQueue.setWake([&] { atTheCall = kept(); });
    deliverRequired();
    fake.machine.mainQueue.setWake({});
    EXPECT_THAT(atTheCall, ElementsAre("org.example.Game", "Game", kMovie, "-", "-"));
}

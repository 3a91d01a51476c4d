#include "extension/VKVideoEditorExtensionContext.h"
#include "extension/VKVideoEditorExtensionViewController.h"
#include "support/FakePlatform.h"

#include <gtest/gtest.h>

#include <thread>

using platform::InputItem;
using platform::ItemProvider;
using runtime::Value;

namespace {

/// An attachment whose loading ends when the test says so, on a thread of its own.
class ScriptedProvider final : public ItemProvider {
public:
    explicit ScriptedProvider(bool conforms = true) : m_conforms(conforms) {}

    bool hasItemConformingToTypeIdentifier(std::string_view type) const override
    {
        return m_conforms && type == platform::kGenericDataType;
    }
    void loadItemForTypeIdentifier(std::string_view /*type*/, LoadCompletion completion) override
    {
        m_completion = std::move(completion);
    }

    bool isLoading() const { return m_completion != nullptr; }
    void deliver(const Value& item, const base::ErrorRef& error = nullptr)
    {
        std::thread([&] { m_completion(item, error); }).join();
    }

private:
    bool m_conforms;
    LoadCompletion m_completion;
};

/// Answers before the load call returns.
class ImmediateProvider final : public ItemProvider {
public:
    explicit ImmediateProvider(Value item) : m_item(std::move(item)) {}

    int loads = 0;

    bool hasItemConformingToTypeIdentifier(std::string_view /*type*/) const override { return true; }
    void loadItemForTypeIdentifier(std::string_view /*type*/, LoadCompletion completion) override
    {
        ++loads;
        completion(m_item, nullptr);
    }

private:
    Value m_item;
};

class RecordingConnection final : public platform::AuxiliaryConnection {
public:
    struct Message {
        std::string selector;
        std::vector<std::string> list;
    };
    std::vector<Message> messages;
    base::ErrorRef failure;

    std::shared_ptr<platform::RemoteProxy> remoteObjectProxyWithErrorHandler(ErrorHandler handler) override
    {
        return std::make_shared<Proxy>(*this, std::move(handler));
    }

private:
    class Proxy final : public platform::RemoteProxy {
    public:
        Proxy(RecordingConnection& connection, ErrorHandler handler)
            : m_connection(connection), m_handler(std::move(handler))
        {
        }
        void send(const runtime::Selector& message, const runtime::Arguments& arguments) override
        {
            if (m_connection.failure) {
                m_handler(m_connection.failure);
                return;
            }
            m_connection.messages.push_back(
                {message.name(), runtime::fromValue<std::vector<std::string>>(arguments.at(0))});
        }

    private:
        RecordingConnection& m_connection;
        ErrorHandler m_handler;
    };
};

class Extension : public testing::Test {
protected:
    static constexpr const char* kMovie = "/movie.mp4";

    tests::FakePlatform fake;
    std::shared_ptr<RecordingConnection> connection = std::make_shared<RecordingConnection>();
    std::map<std::string, std::shared_ptr<ScriptedProvider>> providers;
    std::vector<InputItem> items;
    std::shared_ptr<VKVideoEditorExtensionViewController> controller;
    std::shared_ptr<VKVideoEditorExtensionContext> context;

    ~Extension() override { fake.window->setRootViewController(nullptr); }

    /// One more item that the test delivers by its title.
    void offer(const std::string& title)
    {
        providers[title] = std::make_shared<ScriptedProvider>();
        items.push_back({title, {providers[title]}});
    }
    void offerRequired()
    {
        offer(VKVideoEditorExtensionMoviePathKey);
        offer(VKVideoEditorExtensionAppNameKey);
        offer(VKVideoEditorExtensionBundleIdentifierKey);
    }
    void deliverRequired()
    {
        deliver(VKVideoEditorExtensionMoviePathKey, std::string(kMovie));
        deliver(VKVideoEditorExtensionAppNameKey, std::string("Game"));
        deliver(VKVideoEditorExtensionBundleIdentifierKey, std::string("org.example.Game"));
    }
    void deliver(const std::string& title, const Value& item, const base::ErrorRef& error = nullptr)
    {
        providers.at(title)->deliver(item, error);
    }
    /// Starts as the runtime does, by the names of the declaration.
    void start()
    {
        VKVideoEditorExtensionContext::classObject();
        VKVideoEditorExtensionViewController::classObject();
        auto extension =
            platform::instantiateExtension({"VKVideoEditorExtensionContext", "VKVideoEditorExtensionViewController"});
        extension.context->setUp(fake.platform, items, connection);
        context = std::dynamic_pointer_cast<VKVideoEditorExtensionContext>(extension.context);
        controller = std::dynamic_pointer_cast<VKVideoEditorExtensionViewController>(extension.principal);
        controller->view()->setFrame({{0, 0}, tests::FakePlatform::kPhone});
    }
    void show()
    {
        fake.window->setRootViewController(controller);
        fake.window->setVisible(true);
    }
    auto editor() const { return controller->videoEditorViewController(); }
    bool logged(std::string_view text) const
    {
        return fake.machine.log.contains(base::MemoryLog::Line::Kind::Message, text);
    }
};

} // namespace

TEST_F(Extension, TheKeysAreTheTextsThatHostsUse)
{
    EXPECT_STREQ(VKVideoEditorExtensionMoviePathKey, "VKVideoEditorExtensionMovieURLKey");
    EXPECT_STREQ(VKVideoEditorExtensionAppNameKey, "VKVideoEditorExtensionAppNameKey");
    EXPECT_STREQ(VKVideoEditorExtensionBundleIdentifierKey, "VKVideoEditorExtensionBundleIdentifierKey");
    EXPECT_STREQ(VKVideoEditorExtensionFileAttachmentKey, "VKVideoEditorExtensionFileAttachmentKey");
    EXPECT_STREQ(VKVideoEditorExtensionOverrideShareMessageKey, "VKVideoEditorExtensionOverrideShareMessageKey");
    EXPECT_STREQ(VKVideoEditorExtensionOverrideTintColorKey, "VKVideoEditorExtensionOverrideTintColorKey");
}

TEST_F(Extension, TheThreeRequiredItemsAloneBuildOneEditorWithoutTheOptionalValues)
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

TEST_F(Extension, TheEditorIsBuiltOnTheMainQueueFromThePayload)
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

TEST_F(Extension, AnItemTitledWithTheConstantsNameRatherThanItsTextIsIgnored)
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

TEST_F(Extension, TitlesAreComparedExactly)
{
    offer("vkvideoeditorextensionappnamekey");
    offer("VKVideoEditorExtensionAppNameKey ");
    start();
    deliver("vkvideoeditorextensionappnamekey", std::string("lower"));
    deliver("VKVideoEditorExtensionAppNameKey ", std::string("space"));
    EXPECT_EQ(controller->appName(), std::nullopt);
}

TEST_F(Extension, OptionalItemsThatComeLateBuildFurtherEditors)
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

TEST_F(Extension, AFailedItemIsLoggedAndDoesNotStopTheOthers)
{
    offer(VKVideoEditorExtensionOverrideShareMessageKey);
    offerRequired();
    start();
    deliver(VKVideoEditorExtensionOverrideShareMessageKey, {}, base::Error::make("test", 7, "gone"));
    deliverRequired();
    fake.machine.mainQueue.drain();
    EXPECT_TRUE(fake.machine.log.contains(base::MemoryLog::Line::Kind::Error, "Error loading input item for type"));
    ASSERT_TRUE(editor());
    EXPECT_EQ(editor()->overrideShareMessage(), std::nullopt);
}

TEST_F(Extension, WithoutARequiredValueThePayloadBuildsNoEditor)
{
    offerRequired();
    start();
    deliver(VKVideoEditorExtensionMoviePathKey, std::string(kMovie));
    deliver(VKVideoEditorExtensionAppNameKey, std::string("Game"));
    deliver(VKVideoEditorExtensionBundleIdentifierKey, {}, base::Error::make("test", 7, "gone"));
    fake.machine.mainQueue.drain();
    EXPECT_EQ(editor(), nullptr);
}

TEST_F(Extension, ItemsWithoutAttachmentsOrOfAnotherTypeAreSkippedInSilence)
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

TEST_F(Extension, OnlyTheFirstAttachmentCounts)
{
    const auto first = std::make_shared<ScriptedProvider>();
    const auto second = std::make_shared<ScriptedProvider>();
    items.push_back({VKVideoEditorExtensionAppNameKey, {first, second}});
    start();
    EXPECT_TRUE(first->isLoading());
    EXPECT_FALSE(second->isLoading());
}

TEST_F(Extension, ValuesOfTheWrongKindAreAsGoodAsNone)
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

TEST_F(Extension, TheLoadThatCompletesTheRequiredValuesStopsTheEnumeration)
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

TEST_F(Extension, AppearingBeforeAnythingHasLoadedBuildsAnEditorOfNothing)
{
    offerRequired();
    start();
    show();
    ASSERT_TRUE(editor());
    EXPECT_EQ(editor()->bundleIdentifier(), std::nullopt);
    EXPECT_EQ(editor()->videoURL(), std::nullopt);
    EXPECT_EQ(editor()->applicationName(), std::nullopt);
}

TEST_F(Extension, AppearingUsesWhatHasArrivedByThen)
{
    offerRequired();
    start();
    deliverRequired();
    show();
    ASSERT_TRUE(editor());
    EXPECT_EQ(editor()->videoURL(), base::Url::fromPath(kMovie));
}

TEST_F(Extension, AfterDisappearingThereIsNoEditorAndAppearingAgainBuildsOne)
{
    offerRequired();
    start();
    deliverRequired();
    fake.machine.mainQueue.drain();
    show();
    const std::weak_ptr<VKVideoEditorViewController> former = editor();
    fake.window->setVisible(false);
    EXPECT_EQ(editor(), nullptr);
    EXPECT_TRUE(logged("VKVideoEditorExtensionViewController -viewDidDisappear:"));
    EXPECT_TRUE(former.expired());
    EXPECT_EQ(controller->movieURL(), base::Url::fromPath(kMovie));
    fake.window->setVisible(true);
    ASSERT_TRUE(editor());
    EXPECT_EQ(editor()->videoURL(), base::Url::fromPath(kMovie));
}

TEST_F(Extension, FinishingSendsTheListToTheHostUnchanged)
{
    offerRequired();
    start();
    deliverRequired();
    fake.machine.mainQueue.drain();
    *editor()->activityTypes() = {"mail", "VKPublishToYouTube", "mail"};
    editor()->doneAction();
    ASSERT_EQ(connection->messages.size(), 1U);
    EXPECT_EQ(connection->messages.front().selector, "extensionDidFinishWithActivityTypes:");
    EXPECT_EQ(connection->messages.front().list, (std::vector<std::string>{"mail", "VKPublishToYouTube", "mail"}));
    EXPECT_TRUE(logged("VKVideoEditorExtensionViewController -videoEditorViewDidFinishWithActivityTypes:"));
    EXPECT_TRUE(editor());
}

TEST_F(Extension, AFailingCallToTheHostIsOnlyLogged)
{
    start();
    connection->failure = base::Error::make("test", 0x1'0000'0007, "no host");
    context->extensionObjectProxy()->extensionDidFinishWithActivityTypes(std::make_shared<ActivityTypes>());
    EXPECT_TRUE(fake.machine.log.contains(base::MemoryLog::Line::Kind::Error, "error calling extension - 7"));
}

TEST_F(Extension, TheLogTracesStartUpInOrder)
{
    offerRequired();
    start();
    EXPECT_EQ(fake.machine.log.texts(base::MemoryLog::Line::Kind::Message),
              (std::vector<std::string>{
                  "VKVideoEditorExtensionViewController -setupChildViewControllers",
                  "VKVideoEditorExtensionViewController -inputItemsFromClientWithCompletionHandler:",
              }));
}

TEST_F(Extension, TheContextDeclaresBothProtocolsAndKnowsItsController)
{
    start();
    EXPECT_EQ(VKVideoEditorExtensionContext::_extensionAuxiliaryVendorProtocol(),
              (platform::ConnectionInterface{"VKVideoEditorExtensionProtocol", {}}));
    EXPECT_EQ(VKVideoEditorExtensionContext::_extensionAuxiliaryHostProtocol(),
              (platform::ConnectionInterface{"VKVideoEditorExtensionHostProtocol",
                                             {runtime::Selector("extensionDidFinishWithActivityTypes:")}}));
    EXPECT_EQ(context->videoEditorExtensionViewController(), controller);
}

TEST_F(Extension, AnUnknownClassStartsNothing)
{
    EXPECT_EQ(platform::instantiateExtension({"NoSuchContext", "NoSuchController"}).principal, nullptr);
}

TEST_F(Extension, TheFocusViewCanBecomeFirstResponder)
{
    EXPECT_TRUE(VKVideoEditorExtensionViewControllerFocusView().canBecomeFirstResponder());
}

TEST_F(Extension, AppearingWithAnEditorAlreadyThereBuildsNoOther)
{
    offerRequired();
    start();
    deliverRequired();
    fake.machine.mainQueue.drain();
    const auto first = editor();
    show();
    EXPECT_EQ(editor(), first);
    EXPECT_EQ(fake.media.playerCount(), 1U);
}

// Appearing and disappearing, and what the host is told.
#include "ExtensionFixture.h"

#include <functional>

namespace {

class Extension : public ExtensionTest {};

/// Tells of each line when it is written.
class WatchedLog final : public base::Log {
public:
    void message(std::string_view text) override { onLine(text); }
    void error(std::string_view text) override { onLine(text); }
    void console(std::string_view text) override { onLine(text); }

    std::function<void(std::string_view)> onLine;
};

} // namespace

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
    using Line = base::MemoryLog::Line;
    const auto lines = fake.machine.log.lines();
    ASSERT_GE(lines.size(), 2U);
    EXPECT_EQ(lines[lines.size() - 2], (Line{Line::Kind::Error, "error calling extension - 7"}));
    EXPECT_EQ(lines.back(), (Line{Line::Kind::Console, "no host"}));
}

TEST_F(Extension, EachLineOfTheLogComesBeforeWhatItTellsOf)
{
    std::vector<std::string> seen;
    WatchedLog log;
    log.onLine = [&](std::string_view text) {
        const bool loading = providers.begin()->second->isLoading();
        seen.push_back(std::string(text) + (loading ? ", loading" : "") + (editor() ? ", edited" : "")
                       + (connection->messages.empty() ? "" : ", told"));
    };
    const base::System system{log, fake.machine.clock, fake.machine.mainQueue, fake.machine.backgroundQueue,
                              fake.machine.defaultQueue};
    const platform::Platform platform{system,      fake.notifications, fake.device, *fake.window,  fake.images,
                                      fake.files,  fake.bundles,       fake.words,  fake.calendar, fake.media,
                                      fake.photos, fake.store,         fake.sharing};
    offerRequired();
    start(platform);
    deliverRequired();
    fake.machine.mainQueue.drain();
    show();
    editor()->doneAction();
    fake.window->setVisible(false);
    fake.window->setRootViewController(nullptr);
    controller.reset();
    EXPECT_EQ(seen,
              (std::vector<std::string>{
                  "VKVideoEditorExtensionViewController -setupChildViewControllers",
                  "VKVideoEditorExtensionViewController -inputItemsFromClientWithCompletionHandler:",
                  "loaded input items, loading",
                  "VKVideoEditorExtensionViewController -videoEditorViewDidFinishWithActivityTypes:, loading, edited",
                  "VKVideoEditorExtensionViewController -viewDidDisappear:, loading, edited, told",
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

TEST_F(Extension, ItsPropertiesAreWhatTheyWereSetTo)
{
    VKVideoEditorExtensionViewController plain;
    const auto movie = base::Url::fromPath("/movie.mp4");
    const auto attachment = base::Url::fromPath("/save.dat");
    plain.setBundleIdentifier("org.tux");
    plain.setAppName("Tux");
    plain.setMovieURL(movie);
    plain.setFileAttachmentURL(attachment);
    plain.setOverrideShareMessage("Look!");
    plain.setOverrideTintColor(platform::Color::white(0.5));
    EXPECT_EQ(plain.bundleIdentifier(), "org.tux");
    EXPECT_EQ(plain.appName(), "Tux");
    EXPECT_EQ(plain.movieURL(), movie);
    EXPECT_EQ(plain.fileAttachmentURL(), attachment);
    EXPECT_EQ(plain.overrideShareMessage(), "Look!");
    EXPECT_EQ(plain.overrideTintColor(), platform::Color::white(0.5));
    plain.setAppName(std::nullopt);
    EXPECT_EQ(plain.appName(), std::nullopt);
    EXPECT_EQ(plain.bundleIdentifier(), "org.tux") << "each by itself";
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

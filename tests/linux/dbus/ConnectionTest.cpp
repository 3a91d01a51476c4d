#include "Connected.h"

#include <thread>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

class Connection : public Connected {
protected:
    std::shared_ptr<platform::RemoteProxy> proxy()
    {
        return m_extension->remoteObjectProxyWithErrorHandler([this](const base::ErrorRef& error) {
            EXPECT_TRUE(m_mainQueue.isCurrent());
            m_errors.push_back(error);
        });
    }

    std::vector<base::ErrorRef> m_errors;
};

TEST_F(Connection, TellsTheHostWhatTheUserDidInOrder)
{
    connect({});
    proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"b", "ä", "b", ""})});

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return !m_finished.empty(); }));
    EXPECT_THAT(m_finished, ElementsAre(ElementsAre("b", "ä", "b", "")));
    EXPECT_TRUE(tests::whilePumping([&] { return m_extension->flush(std::chrono::hours(1)); })) << "woken";
    m_mainQueue.drain();
    EXPECT_THAT(m_errors, IsEmpty());
}

TEST_F(Connection, AnEmptyListArrivesToo)
{
    connect({});
    proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{})});

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return !m_finished.empty(); }));
    EXPECT_THAT(m_finished, ElementsAre(IsEmpty()));
}

TEST_F(Connection, OnlyTheFirstFinishCounts)
{
    connect({});
    proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"first"})});
    proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"second"})});
    EXPECT_TRUE(tests::whilePumping([&] { return m_extension->flush(std::chrono::hours(1)); })) << "woken, not late";
    m_extension.reset();

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return m_hostDisconnects > 0; }));
    EXPECT_THAT(m_finished, ElementsAre(ElementsAre("first")));
}

TEST_F(Connection, AMessageIsNotLostWhenItsSenderGoesAtOnce)
{
    connect({});
    tests::whilePumping([&] {
        proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"last words"})});
        m_extension.reset();
        return true;
    });

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return m_hostDisconnects > 0; }));
    EXPECT_THAT(m_finished, ElementsAre(ElementsAre("last words")));
}

TEST_F(Connection, AMessageThatTheHostDoesNotAnswerFailsOnce)
{
    connect({});
    proxy()->send(runtime::Selector("explode:"), {});

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return !m_errors.empty(); }));
    EXPECT_EQ(m_errors.size(), 1U);
    EXPECT_EQ(m_errors[0]->code(), dbus::kUnknownMessage);
}

TEST_F(Connection, AnArgumentThatCannotTravelFailsTheMessage)
{
    connect({});
    proxy()->send(kFinish, {runtime::toValue(1.5)});

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return !m_errors.empty(); }));
    EXPECT_EQ(m_errors[0]->code(), dbus::kBadArgument);
    EXPECT_THAT(m_finished, IsEmpty());
}

TEST_F(Connection, AMessageFailsWhenTheHostHasGone)
{
    connect({});
    bool gone = false;
    m_extension->setDisconnectedHandler([&] { gone = true; });
    m_host.reset();
    ASSERT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return gone; }));

    proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"x"})});
    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return !m_errors.empty(); }));
    EXPECT_EQ(m_errors[0]->code(), dbus::kNotConnected);
}

TEST_F(Connection, AHostThatClosesInAnswerIsNoFailure)
{
    connect({});
    int gone = 0;
    m_extension->setDisconnectedHandler([&] { ++gone; });
    proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"x"})});
    ASSERT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return !m_finished.empty(); }));
    m_host->disconnectEditor();

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return gone > 0; }));
    EXPECT_TRUE(m_extension->flush());
    m_mainQueue.drain();
    EXPECT_THAT(m_errors, IsEmpty());
    EXPECT_EQ(gone, 1);
    EXPECT_EQ(m_hostDisconnects, 0) << "the host was told of what it did itself";
}

TEST_F(Connection, EveryMessageIsToldToHaveBeenSentWhetherTheHostTakesItOrNot)
{
    connect({});
    int sent = 0;
    m_extension->setSentHandler([&] { ++sent; });
    for (int i = 0; i < 2; ++i)
        proxy()->send(kFinish, {runtime::toValue(std::vector<std::string>{"x"})});
    EXPECT_EQ(sent, 0) << "told on the main queue";
    m_mainQueue.drain();
    EXPECT_EQ(sent, 2);
    proxy()->send(runtime::Selector("somethingElse"), {});
    m_mainQueue.drain();
    EXPECT_EQ(sent, 2) << "it was none of the host's";
}

TEST_F(Connection, TheEndIsToldToAHandlerThatComesLate)
{
    connect({});
    m_host.reset();
    // The end of a load says that the extension knows.
    bool gone = false;
    m_extension->setDisconnectedHandler([] { ADD_FAILURE() << "was replaced"; });
    m_extension->setDisconnectedHandler([&] { gone = true; });

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return gone; }));
    bool again = false;
    m_extension->setDisconnectedHandler([&] { again = true; });
    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return again; }));
}

TEST_F(Connection, WhatIsBeingLoadedFailsWhenTheHostGoes)
{
    dbus::HostAttachment never;
    bool asked = false;
    never.load = [&](const dbus::LoadedItem&) { asked = true; };
    connect({{"never", {never}}});
    std::promise<std::string> ended;
    m_items[0].attachments[0]->loadItemForTypeIdentifier(platform::kGenericDataType,
                                                         [&](const runtime::Value& value, const base::ErrorRef& error) {
                                                             ended.set_value(Loaded{value, error}.text());
                                                         });
    ASSERT_TRUE(tests::pumpUntil([&] { return asked; }));
    m_host.reset();

    EXPECT_THAT(ended.get_future().get(), HasSubstr("has ended"));
    EXPECT_THAT(load(0).text(), HasSubstr("has ended"));
}

TEST_F(Connection, WhatIsBeingLoadedFailsWhenTheConnectionIsDestroyed)
{
    dbus::HostAttachment never;
    bool asked = false;
    never.load = [&](const dbus::LoadedItem&) { asked = true; };
    connect({{"never", {never}}});
    int completions = 0;
    m_items[0].attachments[0]->loadItemForTypeIdentifier(
        platform::kGenericDataType, [&](const runtime::Value&, const base::ErrorRef& error) {
            EXPECT_TRUE(error);
            ++completions;
            // Asking from within a completion is answered too.
            m_items[0].attachments[0]->loadItemForTypeIdentifier(
                platform::kGenericDataType, [&](const runtime::Value&, const base::ErrorRef&) { ++completions; });
        });
    ASSERT_TRUE(tests::pumpUntil([&] { return asked; }));
    m_extension.reset();
    EXPECT_EQ(completions, 2);

    EXPECT_TRUE(load(0).error) << "an attachment outlives its connection";
}

TEST_F(Connection, TheHostNoticesThatTheExtensionHasGone)
{
    connect({});
    EXPECT_EQ(m_connects, 1);
    m_extension.reset();

    EXPECT_TRUE(tests::pumpUntil([&] { return m_hostDisconnects > 0; }));
    EXPECT_EQ(m_hostDisconnects, 1);
}

TEST_F(Connection, OnlyOneExtensionIsLetIn)
{
    connect({text("secret", "x")});
    const auto second = newExtension(m_host->address());
    bool refused = false;
    second->setDisconnectedHandler([&] { refused = true; });

    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return refused; }));
    EXPECT_FALSE(tests::whilePumping([&] { return second->inputItems(); }));
    EXPECT_EQ(load(0).text(), "x") << "the first is not disturbed";
    EXPECT_EQ(m_connects, 1);
}

TEST_F(Connection, AnswersAlsoWhenTheHostOfAnEarlierOneGoes)
{
    // The later connection often lies where the earlier one lay, and is called the same.
    for (int round = 0; round < 20; ++round) {
        auto earlier = dbus::HostConnection::listen(m_directory.path() / "earlier", {text("t", "v")}, {});
        ASSERT_TRUE(earlier) << earlier.error()->description();
        m_extension = newExtension(earlier.value()->address());
        fetch();
        earlier.value()->disconnectEditor();
        m_extension.reset();
        connect({text("t", "later")});
        earlier.value().reset();
        ASSERT_EQ(load(0).text(), "later") << "in round " << round;
        m_extension.reset();
        m_host.reset();
    }
}

TEST_F(Connection, AnAddressThatNobodyListensAtIsAnError)
{
    dbus::ExtensionConnection extension(m_mainQueue);
    EXPECT_FALSE(extension.connect("unix:path=" + (m_directory.path() / "nobody").native()));
    EXPECT_FALSE(extension.connect("no address at all"));
    EXPECT_FALSE(extension.inputItems());
}

TEST_F(Connection, APathWithOddCharactersIsAnAddress)
{
    const auto odd = m_directory.path() / "a b,c;d=%20\xC3\xA4\xFF";
    std::filesystem::create_directory(odd);
    auto host = dbus::HostConnection::listen(odd / "socket", {text("t", "v")}, {});
    ASSERT_TRUE(host) << host.error()->description();
    m_extension = newExtension(host.value()->address());
    fetch();

    EXPECT_EQ(load(0).text(), "v");
}

TEST_F(Connection, APathThatIsTooLongForASocketIsAnError)
{
    // One byte more, and libdbus refuses it.
    const std::string folder = m_directory.path().native() + "/";
    const std::string longest = folder + std::string(99 - folder.size(), 'x');
    const auto listening = dbus::HostConnection::listen(longest, {text("t", "v")}, {});
    ASSERT_TRUE(listening) << listening.error()->description();
    m_extension = newExtension(listening.value()->address());
    fetch();
    EXPECT_EQ(load(0).text(), "v");

    const auto tooLong = dbus::HostConnection::listen(longest + "x", {}, {});
    ASSERT_FALSE(tooLong);
    EXPECT_THAT(tooLong.error()->description(), HasSubstr("too long"));
}

TEST(Selectors, BecomeMembers)
{
    EXPECT_EQ(dbus::memberName(runtime::Selector("extensionDidFinishWithActivityTypes:")),
              "ExtensionDidFinishWithActivityTypes");
    EXPECT_EQ(dbus::memberName(runtime::Selector("saveAction")), "SaveAction");
    EXPECT_EQ(dbus::memberName(runtime::Selector("add:zoom:")), "AddZoom");
    EXPECT_EQ(dbus::memberName(runtime::Selector("URL:_of:")), "URL_of") << "only small letters have a great one";
    EXPECT_EQ(dbus::interfaceName("VKVideoEditorExtensionHostProtocol"),
              "org.clipsa.VKVideoEditorExtensionHostProtocol");
}

} // namespace

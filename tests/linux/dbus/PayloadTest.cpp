#include "Connected.h"

#include <QThread>

#include <future>
#include <thread>

using testing::HasSubstr;
using testing::IsEmpty;

namespace {

class Payload : public Connected {};

TEST_F(Payload, ArrivesWithTitlesTextsAndColors)
{
    connect({text("one", "Grüße 🎬"),
             text("two", ""),
             {"three", {dbus::HostAttachment::of(platform::Color{0.25, 0.5, 0.75, 0.125}, platform::kColorType)}}});

    ASSERT_EQ(m_items.size(), 3U);
    EXPECT_EQ(m_items[0].attributedTitle, "one");
    EXPECT_EQ(load(0).text(), "Grüße 🎬");
    EXPECT_EQ(load(1).text(), "");
    EXPECT_EQ(runtime::fromValue<platform::Color>(load(2).value), (platform::Color{0.25, 0.5, 0.75, 0.125}));
}

TEST_F(Payload, IsLoadedOnAThreadThatADebuggerShowsByName)
{
    connect({text("t", "v")});
    std::promise<QString> name;
    m_items[0].attachments[0]->loadItemForTypeIdentifier(
        platform::kGenericDataType,
        [&](const runtime::Value&, const base::ErrorRef&) { name.set_value(QThread::currentThread()->objectName()); });
    EXPECT_EQ(tests::whilePumping([&] { return name.get_future().get(); }).toStdString(), "host");
}

TEST_F(Payload, ConformsToTheGenericTypeAndToTheListedOnes)
{
    connect({text("text", "x"),
             {"color", {dbus::HostAttachment::of(platform::Color::black(), platform::kColorType)}},
             {"bare", {dbus::HostAttachment{{}, [](const dbus::LoadedItem& answer) { answer(runtime::Value()); }}}}});

    const auto conforms = [&](std::size_t item, const char* type) {
        return m_items[item].attachments[0]->hasItemConformingToTypeIdentifier(type);
    };
    for (const std::size_t item : {0U, 1U, 2U})
        EXPECT_TRUE(conforms(item, platform::kGenericDataType));
    EXPECT_TRUE(conforms(0, platform::kTextType));
    EXPECT_FALSE(conforms(0, platform::kColorType));
    EXPECT_TRUE(conforms(1, platform::kColorType));
    EXPECT_FALSE(conforms(2, platform::kTextType));
}

TEST_F(Payload, ItemsWithoutAttachmentsAndWithUnknownTitlesPassThrough)
{
    connect({{"empty", {}}, text("nobody knows this", "still here")});

    ASSERT_EQ(m_items.size(), 2U);
    EXPECT_THAT(m_items[0].attachments, IsEmpty());
    EXPECT_EQ(m_items[1].attributedTitle, "nobody knows this");
    EXPECT_EQ(load(1).text(), "still here");
}

TEST_F(Payload, AnEmptyOneIsAnEmptyList)
{
    connect({});

    EXPECT_THAT(m_items, IsEmpty());
}

TEST_F(Payload, IsAsLongAsAnybodyHasUseForAndNoLonger)
{
    std::vector<dbus::HostItem> items(1024, text("t", "v"));
    connect(items);
    EXPECT_EQ(m_items.size(), 1024U);

    m_extension.reset();
    m_host.reset();
    items.push_back(text("one", "too many"));
    listen(std::move(items));
    m_extension = newExtension(m_host->address());
    const auto tooMany = tests::whilePumping([this] { return m_extension->inputItems(); });
    ASSERT_FALSE(tooMany);
    EXPECT_THAT(tooMany.error()->description(), HasSubstr("more items"));
}

TEST_F(Payload, EveryLoadCompletesOnceWithItsOwnItem)
{
    std::vector<dbus::HostItem> items;
    std::vector<std::size_t> order;
    for (std::size_t i = 0; i < 50; ++i) {
        items.push_back(text("item", std::to_string(i)));
        order.push_back((i * 7) % 50);
    }
    connect(std::move(items));

    std::vector<std::string> texts;
    for (const auto& each : load(order))
        texts.push_back(each.text());
    std::vector<std::string> wanted;
    for (const std::size_t index : order)
        wanted.push_back(std::to_string(index));
    EXPECT_THAT(texts, testing::UnorderedElementsAreArray(wanted));
}

TEST_F(Payload, AFailingItemDoesNotStopTheOthers)
{
    dbus::HostAttachment failing;
    failing.load = [](const dbus::LoadedItem& answer) { answer(base::Error::make("test", 1, "the disk is full")); };
    connect({{"failing", {failing}}, text("fine", "fine")});

    const auto loaded = load({0, 1});
    EXPECT_THAT(loaded[0].text(), HasSubstr("the disk is full"));
    EXPECT_FALSE(loaded[0].value.has_value());
    EXPECT_EQ(loaded[1].text(), "fine");
}

TEST_F(Payload, AnItemThatTakesLongHoldsUpNoOther)
{
    dbus::LoadedItem answerLater;
    dbus::HostAttachment slow;
    slow.load = [&](dbus::LoadedItem answer) { answerLater = std::move(answer); };
    connect({{"slow", {slow}}, text("quick", "quick")});

    std::promise<std::string> arrived;
    m_items[0].attachments[0]->loadItemForTypeIdentifier(platform::kGenericDataType,
                                                         [&](const runtime::Value& value, const base::ErrorRef& error) {
                                                             arrived.set_value(Loaded{value, error}.text());
                                                         });
    EXPECT_EQ(load(1).text(), "quick");

    std::thread([&] { answerLater(runtime::toValue("there at last")); }).join();
    EXPECT_EQ(tests::whilePumping([&] { return arrived.get_future().get(); }), "there at last");
}

TEST_F(Payload, ATextAboveOneMiBIsAnErrorOfThatItemAlone)
{
    connect({text("huge", std::string(dbus::kMaximumTextSize + 1, 'x')),
             text("largest", std::string(dbus::kMaximumTextSize, 'x')), text("fine", "fine")});

    EXPECT_THAT(load(0).text(), HasSubstr("longer than 1 MiB"));
    EXPECT_EQ(load(1).text().size(), dbus::kMaximumTextSize);
    EXPECT_EQ(load(2).text(), "fine");
}

TEST_F(Payload, WhatIsNeitherTextNorColorIsAnErrorOfThatItemAlone)
{
    connect({{"number", {dbus::HostAttachment::of(42, platform::kGenericDataType)}}, text("fine", "fine")});

    EXPECT_TRUE(load(0).error);
    EXPECT_EQ(load(1).text(), "fine");
}

TEST_F(Payload, AskedForAsAnotherTypeIsAnError)
{
    connect({text("text", "x"), {"color", {dbus::HostAttachment::of(platform::Color::black(), platform::kColorType)}}});

    EXPECT_TRUE(load(0, platform::kColorType).error);
    EXPECT_TRUE(load(1, platform::kTextType).error);
    EXPECT_FALSE(load(0, platform::kTextType).error);
    EXPECT_FALSE(load(1, platform::kColorType).error);
}

TEST_F(Payload, TheSameItemCanBeLoadedAgain)
{
    connect({text("text", "x")});

    const auto loaded = load({0, 0, 0});
    EXPECT_THAT(loaded, testing::Each(testing::Property(&Loaded::text, "x")));
}

} // namespace

// Catalogues and descriptions that are broken, enormous or meant to harm: there is an answer, and words on the log.
#include "linux/appstream/StoreFixture.h"
#include "support/WithoutPrivileges.h"

#include <atomic>
#include <fstream>
#include <sys/stat.h>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Optional;
using testing::SizeIs;

namespace tests {

namespace {

class StoreBadInput : public StoreFixture {};

} // namespace

TEST_F(StoreBadInput, ABrokenCatalogueIsSaidOnce)
{
    files.write("catalogue/xml/broken.xml", "<?xml version=\"1.0\"?><components><component><id>org.example.Pai");
    for (int i = 0; i < 3; ++i)
        EXPECT_THAT(resultsFor(kPainter), IsEmpty());
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("broken.xml")));
}

TEST_F(StoreBadInput, ABrokenCatalogueDoesNotHideAnother)
{
    files.write("catalogue/xml/broken.xml", "<components><component>");
    files.write("catalogue/xml/empty.xml", "");
    files.write("catalogue/xml/noise.xml.gz", "this was never packed");
    publish("good", component(kPainter, "<name>Painter</name>"), "origin=\"somewhere\"");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
}

TEST_F(StoreBadInput, ABrokenDescriptionIsSaidAndTheCatalogueAnswers)
{
    files.write("usr/metainfo/org.example.Painter.metainfo.xml", "<component><id>org.example.Painter</id><name>Pai");
    publish("good", component(kPainter, "<name>Painter</name>"), "origin=\"somewhere\"");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
    EXPECT_THAT(errors(), testing::Contains(HasSubstr("org.example.Painter.metainfo.xml")));
}

TEST_F(StoreBadInput, ADescriptionThatIsNoPlainFileOrTooLargeIsNone)
{
    const auto directory = files.path() / "usr/metainfo";
    std::filesystem::create_directories(directory / "org.example.Directory.metainfo.xml");
    ASSERT_EQ(::mkfifo((directory / "org.example.Pipe.metainfo.xml").c_str(), 0600), 0);
    files.write("usr/metainfo/org.example.Large.metainfo.xml",
                component("org.example.Large", "<name>Large</name><!--" + std::string(5 << 20, 'x') + "-->"));
    EXPECT_THAT(resultsFor("org.example.Directory"), IsEmpty());
    EXPECT_THAT(resultsFor("org.example.Pipe"), IsEmpty()) << "or it would have waited for ever";
    EXPECT_THAT(resultsFor("org.example.Large"), IsEmpty());
}

TEST_F(StoreBadInput, IdentifiersAreNoPaths)
{
    files.write("usr/secret.metainfo.xml", component("secret", "<name>Secret</name>"));
    files.write("usr/metainfo/.hidden.metainfo.xml", component(".hidden", "<name>Hidden</name>"));
    std::filesystem::create_directories(files.path() / "usr/metainfo/sub");
    for (const std::string& identifier :
         {std::string("../secret"), std::string("sub/../../secret"), std::string(".hidden"), std::string(5000, 'a'),
          std::string("a\0b", 3), std::string("'\"[]()*=|"), std::string("\xFF\xFE")})
        EXPECT_THAT(resultsFor(identifier), IsEmpty()) << identifier;
}

TEST_F(StoreBadInput, TextsThatCouldMisleadAreNone)
{
    for (const std::string& name :
         {std::string("two\nlines"), std::string("turned \u202Eround"), std::string(5000, 'x'), std::string("&#x9;")}) {
        install(kPainter, "<name>" + name + "</name><developer_name>" + name + "</developer_name>");
        const platform::StoreItem item = itemOf(kPainter);
        // The library itself may have made one line of several.
        EXPECT_TRUE(!item.displayName || item.displayName == "two lines") << *item.displayName;
        EXPECT_TRUE(!item.artistName || item.artistName == "two lines") << *item.artistName;
    }
    install(kPainter, "<name>Maler &amp; S\u00F6hne \u05D0</name>");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Maler & S\u00F6hne \u05D0")));
}

TEST_F(StoreBadInput, TooMuchTextIsNotReadAndTheRestAnswers)
{
    install(kPainter, "<name>Painter</name>");
    const auto large = files.write("catalogue/xml/large.xml", "<components>");
    std::filesystem::resize_file(large, std::uintmax_t(129) << 20); // a hole: it takes no room
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("too large")));
}

TEST_F(StoreBadInput, WhatIsPackedCountsAsWhatIsInIt)
{
    const auto packed = files.write("catalogue/xml/large.xml.gz", "");
    std::filesystem::resize_file(packed, std::uintmax_t(17) << 20);
    EXPECT_THAT(resultsFor(kPainter), IsEmpty());
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("too large")));
}

TEST_F(StoreBadInput, ACatalogueOfAHundredMegabytesEndsInAnAnswer)
{
    std::string filling;
    filling.reserve(101 << 20);
    while (filling.size() < (100 << 20))
        filling +=
            component("org.example.Filling", "<description><p>" + std::string(1 << 20, 'x') + "</p></description>");
    publish("large", component(kPainter, "<name>Painter</name>") + filling, "origin=\"somewhere\"");
    install("org.example.Here", "<name>Here</name>");
    EXPECT_THAT(itemOf("org.example.Here").displayName, Optional(std::string("Here")));
}

TEST_F(StoreBadInput, ACacheThatCannotBeWrittenIsSaidAndTheRestAnswers)
{
    publish("good", component(kPainter, "<name>Published</name>"), "origin=\"somewhere\"");
    install("org.example.Here", "<name>Here</name>");
    files.write("cache", "not a directory");
    for (int i = 0; i < 10; ++i) {
        EXPECT_THAT(itemOf("org.example.Here").displayName, Optional(std::string("Here")));
        EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Published"))) << "it could be read";
        EXPECT_THAT(errors(), SizeIs(i + 1)); // ends the store
        EXPECT_THAT(errors(), testing::Each(HasSubstr("cannot be written")));
    }
}

TEST_F(StoreBadInput, ACacheDirectoryThatCannotBeWrittenIsSaid)
{
    publish("good", component(kPainter, "<name>Published</name>"), "origin=\"somewhere\"");
    install("org.example.Here", "<name>Here</name>");
    std::filesystem::create_directories(options.cache);
    std::filesystem::permissions(options.cache, std::filesystem::perms(0555));
    const WithoutPrivileges asAnybody; // the worker's, too
    EXPECT_THAT(itemOf("org.example.Here").displayName, Optional(std::string("Here")));
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("cannot be written")));
}

TEST_F(StoreBadInput, ACacheOfNoiseIsMadeAnew)
{
    publish("good", component(kPainter, "<name>Painter</name>"), "origin=\"somewhere\"");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
    store.reset();
    std::size_t spoilt = 0;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(options.cache))
        if (entry.is_regular_file()) {
            std::ofstream(entry.path(), std::ios::binary) << "noise";
            ++spoilt;
        }
    EXPECT_GT(spoilt, 0U);
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
}

TEST_F(StoreBadInput, EndsWhileALookupRunsAndNothingIsAnsweredAfterwards)
{
    publish("good", component(kPainter, "<name>Painter</name>"), "origin=\"somewhere\"");
    std::atomic<int> answers = 0;
    std::promise<void> begun, mayEnd;
    const auto held = std::make_shared<int>();
    open().start(requestFor({kPainter}), [&](const auto&, const auto&) {
        ++answers;
        begun.set_value();
        mayEnd.get_future().wait();
    });
    for (int i = 0; i < 3; ++i)
        open().start(requestFor({kPainter}), [&, held](const auto&, const auto&) { ++answers; });
    open().prepare();
    begun.get_future().wait();
    store->end();
    open().start(requestFor({kPainter}), [&, held](const auto&, const auto&) { ++answers; });
    mayEnd.set_value();
    store.reset();
    EXPECT_EQ(answers, 1) << "somebody was answered who had been too late";
    EXPECT_EQ(held.use_count(), 1) << "what callbacks hold was kept";
}

TEST_F(StoreBadInput, EndsAtOnceWhenItWasNeverAsked)
{
    open();
    store.reset();
    open().prepare();
    store.reset();
    EXPECT_THAT(errors(), IsEmpty());
}

TEST_F(StoreBadInput, KnowsOneOfThreeThousand)
{
    std::string components;
    for (int i = 0; i < 3000; ++i)
        components += component("org.example.App" + std::to_string(i), "<name>App " + std::to_string(i) + "</name>");
    publish("large", components, "origin=\"somewhere\"");
    EXPECT_THAT(itemOf("org.example.App2999").displayName, Optional(std::string("App 2999")));
    EXPECT_THAT(itemOf("org.example.App0").displayName, Optional(std::string("App 0")));
    EXPECT_THAT(resultsFor("org.example.App3000"), SizeIs(0));
    EXPECT_THAT(errors(), IsEmpty());
}

} // namespace tests

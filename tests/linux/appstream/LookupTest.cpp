#include "linux/appstream/StoreFixture.h"

#include <thread>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Optional;
using testing::SizeIs;

namespace tests {

namespace {

class StoreLookup : public StoreFixture {
protected:
    static constexpr const char* kBody =
        "<name>Painter</name><name xml:lang=\"de\">Maler</name><name xml:lang=\"fr\">Peintre</name>"
        "<developer_name>The Painters</developer_name><developer_name xml:lang=\"fr\">Les peintres</developer_name>"
        "<url type=\"homepage\">https://painter.example/</url>"
        "<categories><category>Graphics</category><category>Qt</category><category>AudioVideo</category></categories>";

    void publishPainter(const std::string& attributes = "origin=\"debian-bookworm-main\"")
    {
        publish("painter", component(kPainter, kBody), attributes);
    }
};

} // namespace

TEST_F(StoreLookup, TheCatalogueSaysAllOfAnApplication)
{
    publishPainter();
    const platform::StoreItem item = itemOf(kPainter);
    EXPECT_THAT(item.displayName, Optional(std::string("Painter")));
    EXPECT_THAT(item.artistName, Optional(std::string("The Painters")));
    EXPECT_THAT(item.shortProductLink, Optional(std::string("https://painter.example/")));
    EXPECT_THAT(item.genreNames, Optional(ElementsAre("Graphics & Photography", "Audio & Video")));
    EXPECT_THAT(errors(), IsEmpty());
}

TEST_F(StoreLookup, ACatalogueInTheDistributionsFormatSaysTheSame)
{
    files.write("catalogue/yaml/painter.yml", "---\nFile: DEP-11\nVersion: '0.16'\nOrigin: debian-bookworm-main\n"
                                              "---\nType: desktop-application\nID: org.example.Painter\n"
                                              "Package: painter\nName:\n  C: Painter\n  de: Maler\n"
                                              "Summary:\n  C: Paints\nDeveloperName:\n  C: The Painters\n"
                                              "Url:\n  homepage: https://painter.example/\n"
                                              "Categories:\n- Qt\n- Graphics\n");
    options.locales = {"de_DE"};
    const platform::StoreItem item = itemOf(kPainter);
    EXPECT_THAT(item.displayName, Optional(std::string("Maler")));
    EXPECT_THAT(item.artistName, Optional(std::string("The Painters")));
    EXPECT_THAT(item.shortProductLink, Optional(std::string("https://painter.example/")));
    EXPECT_THAT(item.genreNames, Optional(SizeIs(1)));
    EXPECT_THAT(errors(), IsEmpty());
}

TEST_F(StoreLookup, WhatNobodyKnowsHasNoResult)
{
    publishPainter();
    EXPECT_THAT(resultsFor("org.example.Nobody"), IsEmpty());
    EXPECT_THAT(resultsFor(""), IsEmpty());
    EXPECT_THAT(errors(), IsEmpty()) << "a catalogue that does not know it is not broken";
}

TEST_F(StoreLookup, WithoutAnyCatalogueThereIsAnAnswer)
{
    EXPECT_THAT(resultsFor(kPainter), IsEmpty());
    EXPECT_THAT(errors(), IsEmpty());
}

TEST_F(StoreLookup, SeveralIdentifiersAreAnsweredInTheirOrder)
{
    publish("two", component("org.example.One", "<name>One</name>") + component("org.example.Two", "<name>Two</name>"),
            "origin=\"somewhere\"");
    const Answer answer = ask(requestFor({"org.example.Two", "org.example.None", "org.example.One"}));
    ASSERT_TRUE(answer.response);
    ASSERT_THAT(answer.response->results, SizeIs(2));
    EXPECT_THAT(answer.response->results[0].displayName, Optional(std::string("Two")));
    EXPECT_THAT(answer.response->results[1].displayName, Optional(std::string("One")));
}

TEST_F(StoreLookup, IdentifiersFitWithAndWithoutTheEndingOfDesktopEntries)
{
    publish("both",
            component("org.example.Old.desktop", "<name>Old</name>") + component("org.example.New", "<name>New</name>"),
            "origin=\"somewhere\"");
    EXPECT_THAT(itemOf("org.example.Old").displayName, Optional(std::string("Old")));
    EXPECT_THAT(itemOf("org.example.Old.desktop").displayName, Optional(std::string("Old")));
    EXPECT_THAT(itemOf("org.example.New.desktop").displayName, Optional(std::string("New")));
    EXPECT_THAT(itemOf("org.example.New").displayName, Optional(std::string("New")));
    install("org.example.Here", "<name>Here</name>");
    EXPECT_THAT(itemOf("org.example.Here.desktop").displayName, Optional(std::string("Here")));
}

TEST_F(StoreLookup, NamesAreInTheUsersLanguage)
{
    publishPainter();
    options.locales = {"de_AT"};
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Maler")));
    EXPECT_THAT(itemOf(kPainter).artistName, Optional(std::string("The Painters"))) << "it has no German name";
}

TEST_F(StoreLookup, TheNextLanguageServesWhereOneIsMissing)
{
    publishPainter();
    install("org.example.Here", kBody);
    options.locales = {"es_ES", "fr_FR", "de"};
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Peintre")));
    EXPECT_THAT(itemOf(kPainter).artistName, Optional(std::string("Les peintres")));
    EXPECT_THAT(itemOf("org.example.Here").displayName, Optional(std::string("Peintre")));
}

TEST_F(StoreLookup, EnglishBeforeAnotherLanguageIsEnglish)
{
    publishPainter();
    options.locales = {"es", "en_GB"};
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
}

TEST_F(StoreLookup, WhoDoesNotWantTheUsersLanguagesGetsTextsAsTheyWereWritten)
{
    publishPainter();
    options.locales = {"de"};
    platform::StoreLookupRequest request = requestFor({kPainter});
    request.localizationStyle = 0;
    const Answer answer = ask(std::move(request));
    ASSERT_TRUE(answer.response && answer.response->results.size() == 1);
    EXPECT_THAT(answer.response->results[0].displayName, Optional(std::string("Painter")));
}

TEST_F(StoreLookup, WhatAnInstalledApplicationSaysOfItselfGoesFirst)
{
    publishPainter();
    install(kPainter, "<name>My Painter</name>");
    const platform::StoreItem item = itemOf(kPainter);
    EXPECT_THAT(item.displayName, Optional(std::string("My Painter")));
    EXPECT_THAT(item.artistName, Optional(std::string("The Painters"))) << "the catalogue says the rest";
    EXPECT_THAT(item.shortProductLink, Optional(std::string("https://painter.example/")));
    EXPECT_THAT(item.genreNames, Optional(SizeIs(2)));
}

TEST_F(StoreLookup, AnInstalledApplicationNeedsNoCatalogue)
{
    install(kPainter, kBody);
    const platform::StoreItem item = itemOf(kPainter);
    EXPECT_THAT(item.displayName, Optional(std::string("Painter")));
    EXPECT_THAT(item.artistName, Optional(std::string("The Painters")));
    EXPECT_THAT(item.shortProductLink, Optional(std::string("https://painter.example/")));
    EXPECT_THAT(item.genreNames, Optional(SizeIs(2)));
}

TEST_F(StoreLookup, TheUsersOwnDescriptionGoesBeforeTheMachines)
{
    install(kPainter, "<name>The machine's</name>");
    install(kPainter, "<name>My own</name>", "home");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("My own")));
}

TEST_F(StoreLookup, DescriptionsUnderTheirFormerNameAreRead)
{
    files.write("usr/metainfo/org.example.Former.appdata.xml", component("org.example.Former", "<name>Former</name>"));
    EXPECT_THAT(itemOf("org.example.Former").displayName, Optional(std::string("Former")));
}

TEST_F(StoreLookup, WithoutADeveloperThereIsNone)
{
    publish("plain", component(kPainter, "<name>Painter</name>"), "origin=\"somewhere\"");
    const platform::StoreItem item = itemOf(kPainter);
    EXPECT_EQ(item.artistName, std::nullopt);
    EXPECT_EQ(item.shortProductLink, std::nullopt);
    EXPECT_EQ(item.genreNames, std::nullopt);
}

TEST_F(StoreLookup, GenresHaveTheNameOfTheirMainCategoryOnce)
{
    const auto genres = [this](const std::string& categories) {
        install(kPainter, "<name>Painter</name><categories>" + categories + "</categories>");
        return itemOf(kPainter).genreNames;
    };
    EXPECT_THAT(genres("<category>Utility</category><category>TextEditor</category><category>System</category>"),
                Optional(ElementsAre("Utilities")));
    EXPECT_EQ(genres("<category>Qt</category><category>X-Vendor</category>"), std::nullopt);
}

TEST_F(StoreLookup, TheDeveloperMayStandInAnElementOfItsOwn)
{
    const auto developer = [this](const std::string& body) {
        install(kPainter, "<name>Painter</name>" + body);
        return itemOf(kPainter).artistName;
    };
    EXPECT_THAT(developer("<developer id=\"example.org\"><name xml:lang=\"de\">Die Maler</name><name>The &amp; "
                          "Painters</name></developer>"),
                Optional(std::string("The & Painters")));
    EXPECT_THAT(developer("<developer><name>Solo</name>and friends</developer>"), Optional(std::string("Solo")));
    EXPECT_THAT(developer("<developer><name>New</name></developer><developer_name>Old</developer_name>"),
                Optional(std::string("Old")));
    EXPECT_EQ(developer("<developer id=\"example.org\"/>"), std::nullopt);
    EXPECT_EQ(developer("<releases><developer><name>Elsewhere</name></developer></releases>"), std::nullopt);
    EXPECT_EQ(developer("<developer><name>two\nlines</name></developer>"), std::nullopt);
}

TEST_F(StoreLookup, OfSeveralOriginsTheOneWithAPublicPageGoesFirst)
{
    publish("a", component(kPainter, "<name>Distribution</name><url type=\"homepage\">https://painter.example/</url>"),
            "origin=\"debian-bookworm-main\" priority=\"50\"");
    publish("b",
            component(kPainter, "<name>Flathub</name><url type=\"homepage\">https://painter.example/</url>"
                                "<bundle type=\"flatpak\">app/org.example.Painter/x86_64/stable</bundle>"),
            "origin=\"flathub\"");
    const platform::StoreItem item = itemOf(kPainter);
    EXPECT_THAT(item.displayName, Optional(std::string("Flathub")));
    EXPECT_THAT(item.shortProductLink, Optional(std::string("https://flathub.org/apps/org.example.Painter")));
}

TEST_F(StoreLookup, OfOriginsWithoutPagesTheHigherPriorityGoesFirstAndThenTheName)
{
    const auto named = [](const char* name) { return component(kPainter, "<name>" + std::string(name) + "</name>"); };
    publish("a", named("Low"), "origin=\"alpha\" priority=\"1\"");
    publish("b", named("High"), "origin=\"zeta\" priority=\"9\"");
    publish("c", named("Equal"), "origin=\"beta\" priority=\"9\"");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Equal")));
}

TEST_F(StoreLookup, AnApplicationGoesBeforeWhatIsNone)
{
    publish("a", component(kPainter, "<name>Fonts</name>", "font"), "origin=\"alpha\" priority=\"9\"");
    publish("b", component(kPainter, "<name>Program</name>"), "origin=\"beta\"");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Program")));
}

TEST_F(StoreLookup, WhatOnlyProvidesAnotherGoesBehindIt)
{
    publish(
        "a",
        component("org.example.Successor", "<name>Successor</name><provides><id>org.example.Painter</id></provides>"),
        "origin=\"alpha\" priority=\"9\"");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Successor")));
    publish("b", component(kPainter, "<name>Itself</name>"), "origin=\"beta\"");
    store.reset();
    options.cache = files.path() / "another cache";
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Itself")));
}

TEST_F(StoreLookup, CataloguesAreReadOnce)
{
    publishPainter();
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
    std::filesystem::remove_all(files.path() / "catalogue");
    std::filesystem::remove_all(files.path() / "cache");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Painter")));
}

TEST_F(StoreLookup, PreparingReadsAheadOfTheFirstLookup)
{
    publishPainter();
    options.locales = {"de"};
    open().prepare();
    ask(requestFor({})); // comes behind it, and reads nothing itself
    std::filesystem::remove_all(files.path() / "catalogue");
    std::filesystem::remove_all(files.path() / "cache");
    EXPECT_THAT(itemOf(kPainter).displayName, Optional(std::string("Maler")));
}

TEST_F(StoreLookup, IsAnsweredOnAThreadOfTheStores)
{
    std::promise<std::thread::id> answeredOn;
    open().start(requestFor({kPainter}),
                 [&](const auto&, const auto&) { answeredOn.set_value(std::this_thread::get_id()); });
    EXPECT_NE(answeredOn.get_future().get(), std::this_thread::get_id());
}

TEST_F(StoreLookup, AnotherProfileIsAnError)
{
    const Answer answer = ask({"reviews", 1, {kPainter}});
    EXPECT_FALSE(answer.response);
    ASSERT_TRUE(answer.error);
    EXPECT_EQ(answer.error->code(), storefront::kStoreBadRequest);
}

TEST_F(StoreLookup, WithoutTheLibraryEachRequestIsAnErrorAndTheLogSaysItOnce)
{
    options.library = (files.path() / "none.so").native();
    open().prepare();
    for (int i = 0; i < 2; ++i) {
        const Answer answer = ask(requestFor({kPainter}));
        EXPECT_FALSE(answer.response);
        ASSERT_TRUE(answer.error);
        EXPECT_EQ(answer.error->code(), storefront::kStoreUnavailable);
    }
    EXPECT_THAT(errors(), ElementsAre(HasSubstr("none.so")));
}

} // namespace tests

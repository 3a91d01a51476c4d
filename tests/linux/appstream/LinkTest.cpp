// What a person is given to find an application by.
#include "linux/appstream/StoreFixture.h"

#include <ostream>

namespace tests {

namespace {

struct Published {
    const char* name;
    const char* attributes;
    const char* identifier;
    const char* body;
    std::optional<std::string> link;

    friend void PrintTo(const Published& published, std::ostream* stream) { *stream << published.name; }
};

std::string nameOf(const testing::TestParamInfo<Published>& info)
{
    return info.param.name;
}

class StoreLink : public StoreFixture, public testing::WithParamInterface<Published> {};

constexpr const char* kFlathub = "origin=\"flathub\"";
constexpr const char* kDebian = "origin=\"debian-bookworm-main\"";
constexpr const char* kFlatpak = "origin=\"flatpak\"";
constexpr const char* kStable = "<bundle type=\"flatpak\">app/org.example.Painter/x86_64/stable</bundle>";

std::string homepage(const std::string& address)
{
    return "<url type=\"homepage\">" + address + "</url>";
}

} // namespace

TEST_P(StoreLink, LeadsWhereAnybodyCanGo)
{
    const Published& published = GetParam();
    publish("one", component(published.identifier, "<name>Painter</name>" + std::string(published.body)),
            published.attributes);
    EXPECT_EQ(itemOf(published.identifier).shortProductLink, published.link);
}

INSTANTIATE_TEST_SUITE_P(
    Published, StoreLink,
    testing::Values(
        Published{"OfFlathubItsPage", kFlathub, "org.example.Painter", kStable,
                  "https://flathub.org/apps/org.example.Painter"},
        Published{"OfFlathubWithoutABundleTheIdentifiers", kFlathub, "org.example.Painter.desktop", "",
                  "https://flathub.org/apps/org.example.Painter"},
        Published{"TheBundleKnowsBetterThanTheIdentifier", kFlathub, "painter.desktop", kStable,
                  "https://flathub.org/apps/org.example.Painter"},
        Published{"OfARepositoryWithFlathubsMarksItsPage", kFlatpak, "org.example.Painter",
                  "<custom><value key=\"flathub::manifest\">https://x.example</value></custom>",
                  "https://flathub.org/apps/org.example.Painter"},
        Published{
            "OfAnotherRepositoryTheHomepage", kFlatpak, "org.example.Painter",
            "<url type=\"homepage\">https://painter.example</url><custom><value key=\"other::x\">1</value></custom>",
            "https://painter.example"},
        Published{"OfABetaTheHomepage", kFlathub, "org.example.Painter",
                  "<url type=\"homepage\">https://painter.example</url>"
                  "<bundle type=\"flatpak\">app/org.example.Painter/x86_64/beta</bundle>",
                  "https://painter.example"},
        Published{"OfARuntimeNothing", kFlathub, "org.example.Painter",
                  "<bundle type=\"flatpak\">runtime/org.example.Painter/x86_64/stable</bundle>", std::nullopt},
        Published{"OfNoKnownReferenceNothing", kFlathub, "org.example.Painter",
                  "<bundle type=\"flatpak\">any/org.example.Painter/x86_64/stable</bundle>", std::nullopt},
        Published{"OfADistributionTheHomepage", kDebian, "org.example.Painter",
                  "<url type=\"homepage\">https://painter.example</url>", "https://painter.example"},
        Published{"OfNobodyKnownWithoutAHomepageNothing", kDebian, "org.example.Painter", "", std::nullopt},
        Published{"PlainHttpIsOfTheWebToo", kDebian, "org.example.Painter",
                  "<url type=\"homepage\">HTTP://painter.example/a?b=c#d</url>", "HTTP://painter.example/a?b=c#d"},
        Published{"AnotherKindOfAddressIsNoHomepage", kDebian, "org.example.Painter",
                  "<url type=\"bugtracker\">https://painter.example</url>", std::nullopt}),
    nameOf);

TEST_F(StoreFixture, ARepositorysOriginIsKnownByTheIconsOfItsRemote)
{
    const auto linkIn = [this](const std::string& remote) {
        store.reset();
        files.write(remote + "/aarch64/active/icons/64x64/org.example.Painter.png", "");
        publish("one",
                component("org.example.Painter.desktop", "<name>Painter</name>" + homepage("https://painter.example")),
                kFlatpak);
        return itemOf(kPainter).shortProductLink;
    };
    EXPECT_EQ(linkIn("system remotes/another"), "https://painter.example");
    EXPECT_EQ(linkIn("user remotes/flathub"), "https://flathub.org/apps/org.example.Painter");
}

TEST_F(StoreFixture, TheOriginOfADistributionIsNoRemotes)
{
    files.write("system remotes/flathub/x86_64/active/icons/128x128/org.example.Painter.png", "");
    publish("one", component(kPainter, "<name>Painter</name>" + homepage("https://painter.example")), kDebian);
    EXPECT_EQ(itemOf(kPainter).shortProductLink, "https://painter.example");
}

TEST_F(StoreFixture, LinksAreOfTheWebOnly)
{
    for (const char* address : {"file:///etc/passwd", "javascript:alert(1)", "appstream://org.example.Painter",
                                "mailto:a@b.example", "https://", "https:///path", "https://two words.example/",
                                "https://p\u00E4inter.example/", "painter.example", ""}) {
        install(kPainter, "<name>Painter</name>" + homepage(address));
        EXPECT_EQ(itemOf(kPainter).shortProductLink, std::nullopt) << address;
    }
    install(kPainter, "<name>Painter</name>" + homepage("https://" + std::string(3000, 'x')));
    EXPECT_EQ(itemOf(kPainter).shortProductLink, std::nullopt);
}

TEST_F(StoreFixture, AnIdentifierThatNoRepositoryTakesHasNoPage)
{
    for (const char* identifier : {"painter", "org.painter", ".org.example.painter", "org..example.painter",
                                   "org.example.p?inter", "org.example.painter."}) {
        publish("one", component(identifier, "<name>Painter</name>"), kFlathub);
        store.reset();
        options.cache = files.path() / ("cache of " + std::string(identifier));
        for (const platform::StoreItem& item : resultsFor(identifier))
            EXPECT_EQ(item.shortProductLink, std::nullopt) << identifier;
    }
}

} // namespace tests

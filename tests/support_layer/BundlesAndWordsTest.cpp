#include "support/VKBundleExtensions.h"

#include "support/FakeBundles.h"

#include <gmock/gmock.h>

#include <thread>

namespace {

using testing::Optional;
using tests::FakeBundle;
using tests::FakeBundles;

constexpr const char* kFramework = "/System/Library/Frameworks/Velkor.framework";

class WordsOfTheFramework : public testing::Test {
protected:
    void addFramework(const std::vector<std::string>& languages)
    {
        const auto framework = bundles.add(kFramework);
        framework->tables["Localizable"] = {{"SHARE", "of the framework"}};
        for (const std::string& each : languages) {
            framework->languages.push_back(each);
            framework->resources.insert(each + "/Localizable.strings");
            bundles.add(kFramework + ("/" + each + ".lproj"))->tables["Localizable"] = {{"SHARE", "in " + each}};
        }
    }
    static std::string path(const platform::BundleRef& bundle) { return bundle ? bundle->bundlePath() : "(none)"; }
    std::optional<std::string> text(const char* key = "SHARE")
    {
        return VKExtensions::_vkLocalizedStringFromFrameworkBundleWithKey(bundles, key);
    }

    FakeBundles bundles;
};

TEST_F(WordsOfTheFramework, AreInTheLanguageThatServesTheUserBest)
{
    addFramework({"en", "fr"});
    bundles.spoken.preferred = {"fr-CA"};
    EXPECT_EQ(path(VKExtensions::localizedBundle(bundles)), std::string(kFramework) + "/fr.lproj");
    EXPECT_EQ(path(VKExtensions::fallbackBundle(bundles)), std::string(kFramework) + "/fr.lproj");
    EXPECT_THAT(text(), Optional(std::string("in fr")));
}

TEST_F(WordsOfTheFramework, AreElseInTheBaseLanguageOfWhatTheUserPrefersMost)
{
    addFramework({"zh"});
    bundles.spoken.preferred = {"zh-Hans-CN", "en"};
    bundles.spoken.servesNobody = true;
    EXPECT_EQ(path(VKExtensions::localizedBundle(bundles)), "(none)");
    EXPECT_EQ(path(VKExtensions::fallbackBundle(bundles)), std::string(kFramework) + "/zh.lproj");
    EXPECT_THAT(text(), Optional(std::string("in zh")));
}

TEST_F(WordsOfTheFramework, AreElseThoseOfTheFrameworkItself)
{
    addFramework({"fr"});
    bundles.spoken.preferred = {"ja"};
    EXPECT_EQ(path(VKExtensions::localizedBundle(bundles)), "(none)");
    EXPECT_EQ(path(VKExtensions::fallbackBundle(bundles)), "(none)");
    EXPECT_THAT(text(), Optional(std::string("of the framework")));
}

TEST_F(WordsOfTheFramework, AreTheKeyWhereTheFirstBundleThatIsThereLacksIt)
{
    addFramework({"en"});
    bundles.at(kFramework)->tables["Localizable"]["ONLY_THERE"] = "of the framework";
    EXPECT_THAT(text("ONLY_THERE"), Optional(std::string("ONLY_THERE"))) << "the next one is not asked";
    EXPECT_THAT(text("NOWHERE"), Optional(std::string("NOWHERE")));
    bundles.remove(std::string(kFramework) + "/en.lproj");
    EXPECT_THAT(text("ONLY_THERE"), Optional(std::string("of the framework")));
}

TEST_F(WordsOfTheFramework, AreNothingWithoutAnyBundle)
{
    EXPECT_EQ(VKExtensions::_vkFrameworkBundle(bundles), nullptr);
    EXPECT_EQ(text(), std::nullopt);
    addFramework({"en"});
    EXPECT_EQ(text(), std::nullopt) << "it is looked for once";
}

TEST_F(WordsOfTheFramework, ComeFromOneBundleThatIsMadeOnceHoweverManyComeFirst)
{
    addFramework({"en"});
    std::vector<std::thread> threads;
    std::vector<platform::BundleRef> found(4);
    for (auto& each : found)
        threads.emplace_back([&] { each = VKExtensions::_vkFrameworkBundle(bundles); });
    for (auto& thread : threads)
        thread.join();
    EXPECT_THAT(found, testing::Each(bundles.at(kFramework)));
    EXPECT_EQ(bundles.opened.load(), 1);
}

class WordsOfThePhotoFramework : public testing::Test {
protected:
    std::shared_ptr<FakeBundle> addFramework()
    {
        const auto framework = bundles.add("/photos");
        bundles.classes["GPPhotoTileViewController"] = "/photos";
        return framework;
    }

    FakeBundles bundles;
};

TEST_F(WordsOfThePhotoFramework, AreInTheFirstTableThatHasThem)
{
    const auto framework = addFramework();
    framework->tables["Pictora-GM"] = {{"CLOSE", "fourth"}, {"LAST", "fourth"}};
    framework->tables["Pictora-Cascada"] = {{"CLOSE", "third"}, {"THIRD", "third"}};
    framework->tables["Pictora"] = {{"CLOSE", "second"}, {"SECOND", "second"}};
    framework->tables["Pictora-Device"] = {{"CLOSE", "first"}};
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "CLOSE"), Optional(std::string("first")));
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "SECOND"), Optional(std::string("second")));
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "THIRD"), Optional(std::string("third")));
    framework->asked.clear();
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "LAST"), Optional(std::string("fourth")));
    EXPECT_THAT(framework->asked,
                testing::ElementsAre("Pictora-Device LAST", "Pictora LAST", "Pictora-Cascada LAST", "Pictora-GM LAST"));
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "NOWHERE"), Optional(std::string("NOWHERE")));
}

TEST_F(WordsOfThePhotoFramework, AreMissingWhereATranslationIsItsKey)
{
    const auto framework = addFramework();
    framework->tables["Pictora-Device"] = {{"CLOSE", "CLOSE"}};
    framework->tables["Pictora"] = {{"CLOSE", "Close"}};
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "CLOSE"), Optional(std::string("Close")));
}

TEST_F(WordsOfThePhotoFramework, AreNothingUntilThereIsABundleWhichIsThenKept)
{
    EXPECT_EQ(VKLocalizedFrameworkString(bundles, "CLOSE"), std::nullopt);
    addFramework()->tables["Pictora"] = {{"CLOSE", "Close"}};
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "CLOSE"), Optional(std::string("Close")));
    bundles.classes.clear();
    EXPECT_THAT(VKLocalizedFrameworkString(bundles, "CLOSE"), Optional(std::string("Close")));
    EXPECT_EQ(VKPictoraFrameworkBundle(bundles), bundles.at("/photos"));
}

class AnAppsName : public testing::Test {
protected:
    FakeBundle bundle{"/app"};
};

TEST_F(AnAppsName, IsTheOneInTheUsersLanguageFirst)
{
    bundle.localizedInfo = {{"CFBundleDisplayName", "Rennen"}};
    bundle.info = {{"CFBundleDisplayName", "Racing"}, {platform::kBundleNameKey, "racer"}};
    EXPECT_EQ(VKExtensions::_vkLocalizedAppName(bundle), "Rennen");
    bundle.localizedInfo = {{platform::kBundleNameKey, "Rennen"}};
    EXPECT_EQ(VKExtensions::_vkLocalizedAppName(bundle), "Racing");
    bundle.info.erase("CFBundleDisplayName");
    EXPECT_EQ(VKExtensions::_vkLocalizedAppName(bundle), "racer");
}

TEST_F(AnAppsName, IsEmptyAndNeverNothing)
{
    EXPECT_EQ(VKExtensions::_vkLocalizedAppName(bundle), "");
}

TEST_F(AnAppsName, IsFoundByItsIdentifier)
{
    FakeBundles bundles;
    bundles.add("/app")->identifier = "org.tux";
    bundles.at("/app")->info = {{platform::kBundleNameKey, "Tux"}};
    EXPECT_THAT(VKExtensions::_vkLocalizedAppNameFromBundleID(bundles, "org.tux"), Optional(std::string("Tux")));
    EXPECT_EQ(VKExtensions::_vkLocalizedAppNameFromBundleID(bundles, "org.unknown"), std::nullopt);
    bundles.at("/app")->info.clear();
    EXPECT_THAT(VKExtensions::_vkLocalizedAppNameFromBundleID(bundles, "org.tux"), Optional(std::string()));
}

TEST(ABaseIdentifier, IsAllButTheLastPart)
{
    EXPECT_EQ(VKExtensions::baseIdentifier("com.example.app"), "com.example");
    EXPECT_EQ(VKExtensions::baseIdentifier("com"), "");
    EXPECT_EQ(VKExtensions::baseIdentifier(""), "");
    EXPECT_EQ(VKExtensions::baseIdentifier(".a"), "");
    EXPECT_EQ(VKExtensions::baseIdentifier("a."), "a");
}

TEST(TheBundleOfAProcess, IsThatOfItsProgram)
{
    FakeBundles bundles;
    bundles.add("/app");
    bundles.programs[7] = "/app/bin/run";
    bundles.programs[8] = "/elsewhere";
    bundles.bundlesOfPrograms["/app/bin/run"] = "/app";
    EXPECT_EQ(VKExtensions::bundleWithPID(bundles, 7), bundles.at("/app"));
    EXPECT_EQ(VKExtensions::bundleWithPID(bundles, 8), nullptr);
    EXPECT_EQ(VKExtensions::bundleWithPID(bundles, 9), nullptr);
}

} // namespace

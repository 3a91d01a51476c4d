#include "platform/files/DirectoryBundle.h"

#include "linux/xdg/FileManager.h"
#include "support/FakeFileManager.h"
#include "support/FakeLanguages.h"
#include "support/PrivateDirectory.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <thread>

namespace {

using platform::DirectoryBundle;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

class ADirectoryAsABundle : public testing::Test {
protected:
    ADirectoryAsABundle()
    {
        files.addText("/b/Info.strings", "BundleIdentifier = org.example; Classes = \"One Two\";");
        files.addText("/b/en.lproj/Words.strings", "\"A\" = \"a in English\"; \"B\" = \"b in English\";");
        files.addText("/b/fr.lproj/Words.strings", "\"A\" = \"a en français\";");
        files.addText("/b/fr.lproj/Info.strings", "CFBundleDisplayName = Exemple;");
    }

    std::shared_ptr<const DirectoryBundle> open(const std::string& path = "/b")
    {
        return DirectoryBundle::open(files, languages, path);
    }
    std::string text(const char* key, const std::optional<std::string>& value = {}, const char* table = "Words")
    {
        return open()->localizedString(key, value, table);
    }

    tests::TestSystem machine;
    tests::FakeFileManager files{machine.system};
    tests::FakeLanguages languages;
};

TEST_F(ADirectoryAsABundle, IsThereWhereADirectoryIs)
{
    EXPECT_EQ(open("/b")->bundlePath(), "/b");
    EXPECT_EQ(open("/b")->resourcePath(), "/b");
    EXPECT_EQ(open("/c"), nullptr);
    EXPECT_EQ(open("/b/Info.strings"), nullptr);
}

TEST_F(ADirectoryAsABundle, SaysWhoItIs)
{
    EXPECT_EQ(open()->bundleIdentifier(), "org.example");
    EXPECT_EQ(open("/b/fr.lproj")->bundleIdentifier(), "");
    EXPECT_THAT(open()->infoDictionary(), Contains(Pair("Classes", "One Two")));
}

TEST_F(ADirectoryAsABundle, HasTheLanguagesOfItsDirectories)
{
    files.addDirectory("/b/.lproj");
    files.addDirectory("/b/de.lprojx");
    EXPECT_THAT(open()->localizations(), testing::UnorderedElementsAre("en", "fr"));
    EXPECT_THAT(open("/b/fr.lproj")->localizations(), IsEmpty());
}

TEST_F(ADirectoryAsABundle, SpeaksTheUsersLanguage)
{
    languages.preferred = {"fr"};
    EXPECT_EQ(text("A"), "a en français");
    EXPECT_THAT(open()->localizedInfoDictionary(), ElementsAre(Pair("CFBundleDisplayName", "Exemple")));
    languages.preferred = {"de", "fr"};
    EXPECT_EQ(text("A"), "a en français");
    languages.preferred = {"en"};
    EXPECT_EQ(text("A"), "a in English");
    EXPECT_THAT(open()->localizedInfoDictionary(), IsEmpty());
}

TEST_F(ADirectoryAsABundle, SpeaksEnglishToWhomItCannotSpeakOtherwise)
{
    languages.preferred = {"ja"};
    EXPECT_EQ(text("A"), "a in English");
    files.addText("/b/Info.strings", "DevelopmentLocalization = fr;");
    EXPECT_EQ(text("A"), "a en français");
}

TEST_F(ADirectoryAsABundle, GivesTheValueOrTheKeyForATextThatItLacks)
{
    languages.preferred = {"fr"};
    EXPECT_EQ(text("B"), "B") << "a table in another language is another table";
    EXPECT_EQ(text("B", "value"), "value");
    EXPECT_EQ(text("B", ""), "B");
    EXPECT_EQ(text("A", "value"), "a en français");
    EXPECT_EQ(text("A", "value", "Other"), "value");
}

TEST_F(ADirectoryAsABundle, HasTheTablesThatLieInIt)
{
    EXPECT_EQ(open("/b/fr.lproj")->localizedString("A", {}, "Words"), "a en français");
    files.addText("/b/Words.strings", "\"A\" = \"a for all\";");
    EXPECT_EQ(text("A"), "a for all");
    EXPECT_EQ(text("B"), "b in English");
}

TEST_F(ADirectoryAsABundle, FindsAFileOfALanguage)
{
    EXPECT_EQ(open()->pathForResource("Words", "strings", "fr"), "/b/fr.lproj/Words.strings");
    EXPECT_EQ(open()->pathForResource("Words", "strings", "de"), std::nullopt);
    EXPECT_EQ(open()->pathForResource("Words", "stringsdict", "fr"), std::nullopt);
}

TEST_F(ADirectoryAsABundle, ReadsEachTableOnce)
{
    const auto bundle = open();
    files.calls.clear();
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(bundle->localizedString("A", {}, "Words"), "a in English");
    EXPECT_EQ(std::count(files.calls.begin(), files.calls.end(), "read /b/en.lproj/Words.strings"), 1);
    EXPECT_THAT(machine.log.lines(), IsEmpty()) << "a table that is not there is nothing to talk of";
}

TEST_F(ADirectoryAsABundle, SaysOnceThatATableIsBrokenAndGoesOnWithWhatItUnderstands)
{
    files.addText("/b/en.lproj/Words.strings", "\"A\" = \"a\";\n\"B\" \"b\";");
    const auto bundle = open();
    EXPECT_EQ(bundle->localizedString("A", {}, "Words"), "a");
    EXPECT_EQ(bundle->localizedString("B", {}, "Words"), "B");
    ASSERT_EQ(machine.log.lines().size(), 1U);
    EXPECT_EQ(machine.log.lines()[0].text, "/b/en.lproj/Words.strings, line 2: there is no = behind the key");
}

TEST_F(ADirectoryAsABundle, SaysThatATableCannotBeRead)
{
    files.fail(tests::FileOperation::Read, "/b/en.lproj/Words.strings", EIO);
    EXPECT_EQ(text("A"), "A");
    EXPECT_EQ(machine.log.lines().size(), 1U);
    files.addFile("/b/en.lproj/Large.strings", (4 << 20) + 1);
    EXPECT_EQ(text("A", {}, "Large"), "A");
    EXPECT_EQ(machine.log.lines().size(), 2U);
    files.addFile("/b/en.lproj/Full.strings", 4 << 20);
    EXPECT_EQ(text("A", {}, "Full"), "A");
    EXPECT_EQ(machine.log.lines().size(), 2U);
}

TEST_F(ADirectoryAsABundle, IsAskedByThreadsAtOnce)
{
    const tests::PrivateDirectory directory;
    for (const char* table : {"One", "Two", "Three"})
        directory.write(std::string("en.lproj/") + table + ".strings", std::string("A = ") + table + ";");
    xdg::FileManager real(machine.system, {});
    const auto bundle = DirectoryBundle::open(real, languages, directory.path());
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([&bundle] {
            for (const char* table : {"One", "Two", "Three"})
                EXPECT_EQ(bundle->localizedString("A", {}, table), table);
        });
    for (auto& thread : threads)
        thread.join();
}

} // namespace

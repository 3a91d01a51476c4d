#include "linux/xdg/Bundles.h"

#include "linux/icu/Languages.h"
#include "linux/xdg/FileManager.h"
#include "support/FakeLanguages.h"
#include "support/PrivateDirectory.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <sys/stat.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Pair;

class TheBundlesOfAMachine : public testing::Test {
protected:
    static xdg::MountTable mounts(const fs::path& library)
    {
        xdg::MountTable table;
        table.mount("/System/Library", library);
        return table;
    }
    fs::path writeEntry(const std::string& name, const std::string& lines, const char* place = "user")
    {
        return m_directory.write(fs::path(place) / "applications" / name,
                                 "[Desktop Entry]\nType=Application\n" + lines);
    }
    platform::BundleRef application(const std::string& identifier)
    {
        return m_bundles.bundleWithIdentifier(identifier);
    }
    std::string displayName(const std::string& identifier)
    {
        const auto bundle = application(identifier);
        if (!bundle)
            return "(none)";
        const auto info = bundle->localizedInfoDictionary();
        const auto name = info.find(platform::kBundleDisplayNameKey);
        return name == info.end() ? "(untranslated)" : name->second;
    }

    tests::TestSystem m_machine;
    tests::PrivateDirectory m_directory;
    tests::FakeLanguages m_languages;
    xdg::FileManager m_files{m_machine.system, mounts(m_directory.path() / "library")};
    xdg::Bundles m_bundles{m_files,
                           m_languages,
                           {.applications = {m_directory.path() / "user", m_directory.path() / "machine"},
                            .processes = m_directory.path() / "proc"}};
};

TEST_F(TheBundlesOfAMachine, AreDirectoriesThatTheDeviceKnows)
{
    m_directory.write("library/Frameworks/One.framework/Info.strings", "BundleIdentifier = org.one;");
    const std::string path = "/System/Library/Frameworks/One.framework";
    const auto bundle = m_bundles.bundleWithPath(path);
    ASSERT_TRUE(bundle);
    EXPECT_EQ(bundle->bundleIdentifier(), "org.one");
    EXPECT_EQ(m_bundles.bundleWithPath(path), bundle) << "the same again";
    EXPECT_EQ(m_bundles.bundleWithURL(base::Url::fromPath(path)), bundle);
    EXPECT_EQ(m_bundles.bundleWithURL(*base::Url::fromString("https://example.org" + path)), nullptr);
    EXPECT_EQ(m_bundles.bundleWithPath("/System/Library/Frameworks/Two.framework"), nullptr);
    EXPECT_EQ(&m_bundles.languages(), &m_languages);
}

TEST_F(TheBundlesOfAMachine, AreNoneWhereADirectoryLeadsToItself)
{
    fs::create_directories(m_directory.path() / "library/Frameworks");
    const fs::path loop = m_directory.path() / "library/Frameworks/Loop.framework";
    fs::create_directory_symlink(loop, loop);
    EXPECT_EQ(m_bundles.bundleWithPath("/System/Library/Frameworks/Loop.framework"), nullptr);
    EXPECT_EQ(m_bundles.bundleForClassNamed("Anything"), nullptr);
}

TEST_F(TheBundlesOfAMachine, AreKnownByTheirClasses)
{
    m_directory.write("library/Frameworks/A.framework/Info.strings", "Classes = \"First Both\";");
    m_directory.write("library/PrivateFrameworks/B.framework/Info.strings", "Classes = \"Second Both\";");
    m_directory.write("library/PrivateFrameworks/C.framework/Other.strings", "");
    const auto path = [this](const char* name) {
        const auto bundle = m_bundles.bundleForClassNamed(name);
        return bundle ? bundle->bundlePath() : "";
    };
    EXPECT_EQ(path("First"), "/System/Library/Frameworks/A.framework");
    EXPECT_EQ(path("Second"), "/System/Library/PrivateFrameworks/B.framework");
    EXPECT_EQ(path("Both"), "/System/Library/Frameworks/A.framework");
    EXPECT_EQ(path("Fir"), "");
    EXPECT_EQ(path(""), "");
}

TEST_F(TheBundlesOfAMachine, AreKnownByTheIdentifiersOfThoseThatWereOpened)
{
    m_directory.write("library/Frameworks/One.framework/Info.strings", "BundleIdentifier = org.one;");
    EXPECT_EQ(application("org.one"), nullptr);
    const auto bundle = m_bundles.bundleWithPath("/System/Library/Frameworks/One.framework");
    EXPECT_EQ(application("org.one"), bundle);
}

TEST_F(TheBundlesOfAMachine, AreInstalledApplications)
{
    const fs::path entry = writeEntry("org.tux.Racer.desktop", "Name=Tux Racer\nName[de]=Pinguin-Rennen\n");
    const auto bundle = application("org.tux.Racer");
    ASSERT_TRUE(bundle);
    EXPECT_EQ(bundle->bundleIdentifier(), "org.tux.Racer");
    EXPECT_EQ(bundle->bundlePath(), entry);
    EXPECT_EQ(bundle->resourcePath(), entry);
    EXPECT_THAT(bundle->infoDictionary(), ElementsAre(Pair(platform::kBundleNameKey, "Tux Racer")));
    EXPECT_THAT(bundle->localizations(), ElementsAre("de"));
    EXPECT_EQ(bundle->pathForResource("a", "b", "de"), std::nullopt);
    EXPECT_EQ(bundle->localizedString("key", "value", "Table"), "value");
    EXPECT_EQ(bundle->localizedString("key", "", "Table"), "key");
    EXPECT_EQ(m_bundles.bundleWithPath(entry)->bundleIdentifier(), "org.tux.Racer");
    EXPECT_EQ(application("org.tux"), nullptr);
}

TEST_F(TheBundlesOfAMachine, AreCalledAsTheirUsersCallThem)
{
    writeEntry("racer.desktop", "Name=Tux Racer\nName[de]=Pinguin-Rennen\nName[pt_BR]=Corrida\nName[sr@latin]=Trka\n");
    m_languages.preferred = {"de-AT"};
    EXPECT_EQ(displayName("racer"), "Pinguin-Rennen");
    m_languages.preferred = {"pt-BR"};
    EXPECT_EQ(displayName("racer"), "Corrida");
    m_languages.preferred = {"sr-Latn"};
    EXPECT_EQ(displayName("racer"), "Trka");
    m_languages.preferred = {"ja"};
    EXPECT_EQ(displayName("racer"), "(untranslated)");
    m_languages.preferred = {"en-GB", "de"};
    EXPECT_EQ(displayName("racer"), "(untranslated)") << "which is English, and that is preferred";
    writeEntry("racer.desktop", "Name=Racer\nName[en]=The Racer\nName[de_DE.UTF-8]=Rennen\n");
    EXPECT_EQ(displayName("racer"), "The Racer") << "entries are read anew";
    m_languages.preferred = {"de-DE"};
    EXPECT_EQ(displayName("racer"), "Rennen");
}

TEST_F(TheBundlesOfAMachine, AreChosenByWhatLanguagesMean)
{
    writeEntry("racer.desktop", "Name=Racer\nName[pt_BR]=Corrida\nName[zh_TW]=賽車\n");
    const intl::Languages portuguese([](const char* name) { return name == std::string("LANG") ? "pt_PT.UTF-8" : ""; });
    const auto entry =
        xdg::DesktopEntry::open(m_directory.path() / "user/applications/racer.desktop", "racer", portuguese);
    EXPECT_THAT(entry->localizedInfoDictionary(), ElementsAre(Pair(platform::kBundleDisplayNameKey, "Corrida")));
}

TEST_F(TheBundlesOfAMachine, LieInDirectoriesWhoseNamesAreInTheirIdentifiers)
{
    writeEntry("kde/org-game.desktop", "Name=Nested\n");
    writeEntry("a/b/c.desktop", "Name=Deep\n");
    EXPECT_TRUE(application("kde-org-game"));
    EXPECT_TRUE(application("a-b-c"));
    EXPECT_EQ(application("a-b"), nullptr);
    EXPECT_EQ(application("a/b/c"), nullptr);
}

TEST_F(TheBundlesOfAMachine, AreTheUsersBeforeTheMachines)
{
    writeEntry("racer.desktop", "Name=Mine\n", "user");
    writeEntry("racer.desktop", "Name=Everybody's\n", "machine");
    writeEntry("other.desktop", "Name=Other\n", "machine");
    EXPECT_THAT(application("racer")->infoDictionary(), ElementsAre(Pair(platform::kBundleNameKey, "Mine")));
    EXPECT_TRUE(application("other"));
    writeEntry("racer.desktop", "Name=Mine\nHidden=true\n", "user");
    EXPECT_EQ(application("racer"), nullptr) << "the user has removed it";
}

TEST_F(TheBundlesOfAMachine, AreNoEntriesThatLie)
{
    for (const char* lines : {"Type=Link\nName=a\n", "Type=\n", "=\n", "[", "Hidden=true\n"}) {
        writeEntry("liar.desktop", lines);
        const auto bundle = application("liar");
        EXPECT_TRUE(!bundle || bundle->infoDictionary().empty()) << lines;
    }
    for (const char* name : {"", "  ", "two\\nlines", "turned \u202Eround", "\xFF", "bell\a"}) {
        writeEntry("liar.desktop", std::string("Name=") + name + "\nName[en]=" + name + "\n");
        const auto bundle = application("liar");
        ASSERT_TRUE(bundle);
        EXPECT_THAT(bundle->infoDictionary(), IsEmpty()) << name;
        EXPECT_THAT(bundle->localizedInfoDictionary(), IsEmpty()) << name;
    }
    m_directory.write("user/applications/text.desktop", "hello");
    EXPECT_EQ(application("text"), nullptr);
    m_directory.write("user/applications/other.desktop", "[Other]\nType=Application\nName=a\n");
    EXPECT_EQ(application("other"), nullptr);
    writeEntry("large.desktop", "Name=Large\n#" + std::string(1 << 20, 'x') + "\n");
    EXPECT_EQ(application("large"), nullptr);
    fs::create_directories(m_directory.path() / "user/applications/folder.desktop");
    EXPECT_EQ(application("folder"), nullptr);
    ASSERT_EQ(::mkfifo((m_directory.path() / "user/applications/pipe.desktop").c_str(), 0600), 0);
    EXPECT_EQ(application("pipe"), nullptr) << "and does not wait for a writer";
    fs::create_symlink("nowhere", m_directory.path() / "user/applications/dangling.desktop");
    EXPECT_EQ(application("dangling"), nullptr);
}

TEST_F(TheBundlesOfAMachine, AreNotLookedForElsewhere)
{
    m_directory.write("user/outside.desktop", "[Desktop Entry]\nType=Application\nName=Outside\n");
    fs::create_directories(m_directory.path() / "user/applications/a");
    for (const std::string identifier : {"../outside", "..-outside", "a-..-..-outside", "", ".", "..", "/"})
        EXPECT_EQ(application(identifier), nullptr) << identifier;
    EXPECT_EQ(application(std::string("racer\0", 6)), nullptr);
    EXPECT_EQ(application(std::string(256, 'a')), nullptr);
}

TEST_F(TheBundlesOfAMachine, AreThoseOfTheirPrograms)
{
    const fs::path program = m_directory.write("opt/game/bin/racer", "");
    fs::permissions(program, fs::perms::owner_all);
    const auto urlOf = [this](const fs::path& path) {
        const auto url = m_bundles.bundleURLForExecutableURL(base::Url::fromPath(path));
        return url ? url->path() : "(none)";
    };
    EXPECT_EQ(urlOf(program), "(none)");
    const fs::path entry =
        writeEntry("vendor/racer.desktop", "Name=Racer\nExec=\"" + program.native() + "\" --fast %U\n");
    writeEntry("broken.desktop", "Name=Broken\nExec=\"" + program.native() + "\n");
    writeEntry("readme.txt", "Name=Text\nExec=" + program.native() + "\n");
    EXPECT_EQ(urlOf(program), entry);
    EXPECT_EQ(urlOf(m_directory.path() / "opt/game/bin/other"), "(none)");
    EXPECT_EQ(urlOf(m_directory.write("elsewhere/racer", "")), "(none)");
    m_directory.write("opt/game/Info.strings", "BundleName = Game;");
    EXPECT_EQ(urlOf(program), m_directory.path() / "opt/game") << "what it comes with is nearer";
    EXPECT_EQ(m_bundles.bundleURLForExecutableURL(*base::Url::fromString("https://a" + program.native())),
              std::nullopt);
    EXPECT_EQ(m_bundles.bundleURLForExecutableURL(base::Url::fromPath("racer")), std::nullopt);
    EXPECT_EQ(m_bundles.bundleURLForExecutableURL(base::Url::fromPath("")), std::nullopt);
}

TEST_F(TheBundlesOfAMachine, KnowWhatAProcessRuns)
{
    fs::create_directories(m_directory.path() / "proc/12");
    fs::create_symlink("/usr/bin/game", m_directory.path() / "proc/12/exe");
    fs::create_directories(m_directory.path() / "proc/0");
    fs::create_symlink("/usr/bin/none", m_directory.path() / "proc/0/exe");
    EXPECT_EQ(m_bundles.executablePathOfProcess(12), "/usr/bin/game");
    EXPECT_EQ(m_bundles.executablePathOfProcess(13), std::nullopt);
    EXPECT_EQ(m_bundles.executablePathOfProcess(0), std::nullopt);
    EXPECT_EQ(m_bundles.executablePathOfProcess(-12), std::nullopt);
    xdg::Bundles real(m_files, m_languages, xdg::BundlePlaces::ofUser());
    EXPECT_EQ(real.executablePathOfProcess(::getpid()), fs::read_symlink("/proc/self/exe").native());
}

TEST_F(TheBundlesOfAMachine, AreSoughtWhereApplicationsAre)
{
    const auto places = xdg::BundlePlaces::ofUser();
    ASSERT_GE(places.applications.size(), 2U) << "the user's, and the machine's";
    EXPECT_THAT(places.applications.back().native(), HasSubstr("/share"));
    EXPECT_THAT(places.frameworks, ElementsAre("/System/Library/Frameworks", "/System/Library/PrivateFrameworks"));
}

} // namespace

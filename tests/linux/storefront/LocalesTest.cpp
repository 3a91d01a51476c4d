// Which languages the store is asked in, and where it looks.
#include "linux/storefront/Options.h"

#include <gmock/gmock.h>

#include <chrono>
#include <cstdlib>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace {

using testing::ElementsAre;

std::vector<std::string> localesOf(const std::map<std::string, std::string>& environment)
{
    return storefront::preferredLocales([&](const char* name) {
        const auto found = environment.find(name);
        return found == environment.end() ? std::string() : found->second;
    });
}

TEST(StoreLocales, ComeFromLanguageInItsOrderAndThenFromTheLocale)
{
    EXPECT_THAT(localesOf({{"LANGUAGE", "fr_CA:es"}, {"LANG", "de_AT.UTF-8"}}), ElementsAre("fr_CA", "es", "de_AT"));
}

TEST(StoreLocales, TheFirstVariableThatIsSetNamesTheLocale)
{
    EXPECT_THAT(localesOf({{"LC_ALL", "fr_FR"}, {"LC_MESSAGES", "es_ES"}, {"LANG", "de_DE"}}), ElementsAre("fr_FR"));
    EXPECT_THAT(localesOf({{"LC_ALL", ""}, {"LC_MESSAGES", "es_ES"}, {"LANG", "de_DE"}}), ElementsAre("es_ES"));
    EXPECT_THAT(localesOf({{"LANG", "de_DE"}}), ElementsAre("de_DE"));
}

TEST(StoreLocales, HaveNoCodesetButKeepTheirModifier)
{
    EXPECT_THAT(localesOf({{"LANG", "sr_RS.UTF-8@latin"}}), ElementsAre("sr_RS@latin"));
    EXPECT_THAT(localesOf({{"LANG", "de_DE.UTF-8"}}), ElementsAre("de_DE"));
}

TEST(StoreLocales, EndAtEnglishInWhichTextsAreWritten)
{
    EXPECT_THAT(localesOf({{"LANGUAGE", "fr:en_GB:de"}, {"LANG", "es_ES"}}), ElementsAre("fr"));
    EXPECT_THAT(localesOf({{"LANGUAGE", "de_DE:de:en"}, {"LANG", "de_DE.UTF-8"}}), ElementsAre("de_DE"));
    EXPECT_THAT(localesOf({{"LANGUAGE", "de"}, {"LC_ALL", "C.UTF-8"}}), ElementsAre("de"));
    EXPECT_THAT(localesOf({{"LANGUAGE", "en_GB:de"}}), ElementsAre("en_GB"));
    EXPECT_THAT(localesOf({{"LANGUAGE", "C:de"}}), ElementsAre("C"));
    EXPECT_THAT(localesOf({{"LANG", "POSIX"}}), ElementsAre("C"));
    EXPECT_THAT(localesOf({{"LANG", "C.UTF-8"}}), ElementsAre("C"));
    EXPECT_THAT(localesOf({}), ElementsAre("C"));
}

TEST(StoreLocales, ComeOnceAndALanguageNotBehindOneOfItsOwn)
{
    EXPECT_THAT(localesOf({{"LANGUAGE", "de_AT:de:de_AT:fr"}, {"LANG", "de_AT.UTF-8"}}), ElementsAre("de_AT", "fr"));
    EXPECT_THAT(localesOf({{"LANGUAGE", "de:de_CH"}}), ElementsAre("de", "de_CH"));
}

TEST(StoreLocales, AreNamesAndNoPaths)
{
    EXPECT_THAT(localesOf({{"LANGUAGE", "../../de::/fr:nl"}, {"LANG", "a b"}}), ElementsAre("nl"));
    EXPECT_THAT(localesOf({{"LANG", "/usr/lib/locale/x"}}), ElementsAre("C"));
}

TEST(StoreLocales, OnlyEnglishNeedsNoTranslation)
{
    for (const char* locale : {"C", "en", "en_GB", "en@shaw"})
        EXPECT_THAT(localesOf({{"LANGUAGE", std::string(locale) + ":de"}}), ElementsAre(locale));
    for (const char* locale : {"enm", "fr_FR"})
        EXPECT_THAT(localesOf({{"LANGUAGE", std::string(locale) + ":de"}}), ElementsAre(locale, "de"));
}

/// While it lives; what was set before comes back.
class SetVariable {
public:
    SetVariable(const char* name, const char* value) : m_name(name)
    {
        if (const char* const former = std::getenv(name))
            m_former = former;
        ::setenv(name, value, 1);
    }
    ~SetVariable()
    {
        if (m_former)
            ::setenv(m_name, m_former->c_str(), 1);
        else
            ::unsetenv(m_name);
    }
    SetVariable(const SetVariable&) = delete;
    SetVariable& operator=(const SetVariable&) = delete;

private:
    const char* m_name;
    std::optional<std::string> m_former;
};

TEST(StoreOptions, OfTheUserNameHisOwnDirectoriesFirst)
{
    // GLib reads these once in a process; nobody else here asks for them.
    const SetVariable home("XDG_DATA_HOME", "/home/u/data");
    const SetVariable system("XDG_DATA_DIRS", "/opt/share:/usr/share");
    const SetVariable languages("LANGUAGE", "fr:es");
    const SetVariable locale("LC_ALL", "C.UTF-8");
    const storefront::Options options = storefront::Options::ofUser();
    EXPECT_THAT(options.locales, ElementsAre("fr", "es"));
    EXPECT_THAT(options.metainfo, ElementsAre("/home/u/data/metainfo", "/opt/share/metainfo", "/usr/share/metainfo"));
    EXPECT_THAT(options.remotes, ElementsAre("/var/lib/flatpak/appstream", "/home/u/data/flatpak/appstream"));
    EXPECT_TRUE(options.usesMachineCatalogues);
    EXPECT_LE(options.patience, std::chrono::milliseconds(50)) << "half of what a person takes for at once";
}

} // namespace

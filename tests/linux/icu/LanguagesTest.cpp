#include "linux/icu/Languages.h"

#include <gmock/gmock.h>

#include <map>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class TheLanguages : public testing::Test {
protected:
    std::vector<std::string> preferred(const std::map<std::string, std::string>& variables)
    {
        return intl::Languages([&](const char* name) {
                   const auto found = variables.find(name);
                   return found == variables.end() ? "" : found->second;
               })
            .preferredLanguages();
    }
    std::vector<std::string> serving(const std::vector<std::string>& localizations,
                                     const std::vector<std::string>& preferences)
    {
        return intl::Languages([](const char*) { return ""; }).preferredLocalizations(localizations, preferences);
    }
};

TEST_F(TheLanguages, AreThoseOfTheListAndThenThatOfTheLocale)
{
    EXPECT_THAT(preferred({{"LANGUAGE", "de_AT:fr"}, {"LANG", "en_GB.UTF-8"}}), ElementsAre("de-AT", "fr", "en-GB"));
    EXPECT_THAT(preferred({{"LANGUAGE", "fr::fr:de"}, {"LANG", "de"}}), ElementsAre("fr", "de"));
}

TEST_F(TheLanguages, AreThatOfTheFirstVariableThatIsSet)
{
    EXPECT_THAT(preferred({{"LC_ALL", "cs_CZ.UTF-8"}, {"LC_MESSAGES", "de_DE"}, {"LANG", "fr"}}), ElementsAre("cs-CZ"));
    EXPECT_THAT(preferred({{"LC_ALL", ""}, {"LC_MESSAGES", "de_DE"}, {"LANG", "fr"}}), ElementsAre("de-DE"));
    EXPECT_THAT(preferred({{"LANG", "fr_FR@euro"}}), ElementsAre("fr-FR"));
    EXPECT_THAT(preferred({{"LC_ALL", "C.UTF-8"}, {"LANG", "fr"}}), ElementsAre("en")) << "the first says: none";
}

TEST_F(TheLanguages, AreEnglishWhereNoneIsNamed)
{
    EXPECT_THAT(preferred({}), ElementsAre("en"));
    EXPECT_THAT(preferred({{"LANG", "POSIX"}}), ElementsAre("en"));
    EXPECT_THAT(preferred({{"LANGUAGE", "/usr/share:12345678901:\xFF"}, {"LANG", "C"}}), ElementsAre("en"));
}

TEST_F(TheLanguages, KnowScripts)
{
    EXPECT_THAT(preferred({{"LANGUAGE", "sr_RS@latin:uz@cyrillic:zh_TW"}}),
                ElementsAre("sr-Latn-RS", "uz-Cyrl", "zh-TW"));
}

TEST_F(TheLanguages, AreServedByThemselvesAndByCloseRelatives)
{
    EXPECT_THAT(serving({"en", "fr"}, {"fr-CA"}), ElementsAre("fr"));
    EXPECT_THAT(serving({"en", "de", "pt-BR"}, {"pt-PT", "de-AT"}), ElementsAre("pt-BR", "de"));
    EXPECT_THAT(serving({"zh-Hans", "zh-Hant"}, {"zh-TW"}), ElementsAre("zh-Hant"));
    EXPECT_THAT(serving({"zh-Hans", "zh-Hant"}, {"zh"}), ElementsAre("zh-Hans"));
    EXPECT_THAT(serving({"fr", "fr-CA"}, {"fr-CA", "fr"}), ElementsAre("fr-CA", "fr"));
}

TEST_F(TheLanguages, AreInTheOrderOfTheUserWhoHasEachOnce)
{
    EXPECT_THAT(serving({"en", "fr", "de"}, {"de", "en", "de-CH"}), ElementsAre("de", "en"));
}

TEST_F(TheLanguages, AreServedByNoneThatIsForeign)
{
    EXPECT_THAT(serving({"en", "fr"}, {"ja"}), IsEmpty());
    EXPECT_THAT(serving({}, {"ja"}), IsEmpty());
    EXPECT_THAT(serving({"en"}, {}), IsEmpty());
}

TEST_F(TheLanguages, AreSpelledAsTheLocalizationsAre)
{
    EXPECT_THAT(serving({"Base", "not a language", "PT-br", ""}, {"pt-BR", "no language"}), ElementsAre("PT-br"));
}

} // namespace

// The program's own words in all languages, as they are shown: ICU understands each of them.
#include "linux/icu/MessageCatalog.h"

#include "linux/icu/Languages.h"
#include "linux/xdg/Bundles.h"
#include "linux/xdg/FileManager.h"
#include "support/Paths.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <filesystem>

namespace {

using testing::HasSubstr;
using testing::Not;

std::string bundle()
{
    return tests::sourceFile("resources/bundles/Clipsa.bundle");
}

std::vector<std::string> languages()
{
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(bundle()))
        if (entry.path().extension() == ".lproj")
            names.push_back(entry.path().stem());
    return names;
}

class Words : public testing::TestWithParam<std::string> {
protected:
    platform::StringsTable table() const
    {
        const auto text =
            m_files.contentsOfFile(bundle() + "/" + GetParam() + ".lproj/Localizable.strings", std::size_t{1} << 20U);
        const auto parsed = platform::parseStrings(text.valueOr(""), GetParam());
        EXPECT_EQ(parsed.error, nullptr) << parsed.error->description();
        return parsed.table;
    }

    tests::TestSystem m_machine;
    mutable xdg::FileManager m_files{m_machine.system, {}};
    intl::Languages m_languages{[](const char* name) {
        std::string language = GetParam();
        std::replace(language.begin(), language.end(), '-', '_');
        return std::string(name) == "LANGUAGE" ? language : std::string();
    }};
    xdg::Bundles m_bundles{m_files, m_languages, {}};
    intl::MessageCatalog m_catalog{m_bundles, bundle()};
};

TEST_P(Words, AreAllUnderstood)
{
    for (const auto& [key, text] : table()) {
        EXPECT_EQ(m_catalog.text(key), text);
        const std::string shown = m_catalog.text(key, {{"name", "a.mp4"},
                                                       {"names", "a.log and b.log"},
                                                       {"duration", "long"},
                                                       {"length", "0:42"},
                                                       {"size", "12.4 MB"},
                                                       {"rest", "short"},
                                                       {"position", "here"},
                                                       {"part", 0.5},
                                                       {"device", "Phone"},
                                                       {"way", "Bluetooth"},
                                                       {"number", std::int64_t{2}},
                                                       {"activity", "Mail"},
                                                       {"application", "Letters"}});
        EXPECT_THAT(shown, Not(testing::ContainsRegex("[{}]"))) << key;
        if (text.find("{name}") != std::string::npos) {
            EXPECT_THAT(shown, HasSubstr("a.mp4")) << key;
        }
    }
    EXPECT_FALSE(m_catalog.duration(62.5, 1).empty());
}

TEST_P(Words, BeginAtTheRightInArabicAndHebrew)
{
    EXPECT_EQ(m_catalog.isRightToLeft(), GetParam() == "ar" || GetParam() == "he");
}

INSTANTIATE_TEST_SUITE_P(InAllLanguages, Words, testing::ValuesIn(languages()), [](const auto& tested) {
    std::string name = tested.param;
    std::erase(name, '-');
    return name;
});

} // namespace

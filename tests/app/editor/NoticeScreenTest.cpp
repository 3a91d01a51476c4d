#include "app/editor/NoticeScreen.h"

#include "support/EnglishWords.h"

#include <gmock/gmock.h>

using testing::ElementsAre;

namespace {

std::vector<std::string> linesOf(const std::string& text)
{
    const tests::EnglishWords words;
    const auto screen = std::make_shared<app::NoticeScreen>(words, text, true, app::NoticeScreen::Handlers{});
    std::vector<std::string> lines;
    for (const auto& view : screen->view()->subviews())
        if (const auto label = std::dynamic_pointer_cast<platform::Label>(view))
            lines.push_back(label->text());
    return lines;
}

TEST(ANotice, IsBrokenBetweenWordsIntoLinesThatFitOnANarrowPhone)
{
    EXPECT_THAT(linesOf("There is no movie in this file.\nIt ends before its header does; record it again."),
                ElementsAre("There is no movie in this file.", "It ends before its header does; record", "it again."));
}

TEST(ANotice, HasAsManyLettersInALineWhateverTheAlphabet)
{
    // 37 letters, which take twice as many bytes.
    const std::string line = "\u0416\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436 "
                             "\u0416\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436 "
                             "\u0416\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436\u0436";
    EXPECT_THAT(linesOf(line + " " + line), ElementsAre(line, line));
}

} // namespace

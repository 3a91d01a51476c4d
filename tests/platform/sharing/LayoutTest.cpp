// Where everything on the share sheet stands, in both directions of writing.
#include "SharingFixture.h"

#include <algorithm>
#include <cmath>

namespace tests {

namespace {

using base::Rect;

MATCHER_P(IsAt, wanted, "")
{
    const auto differs = [](double one, double other) { return std::abs(one - other) > 1e-6; };
    *result_listener << arg.minX() << ", " << arg.minY() << ", " << arg.width() << " × " << arg.height();
    return !differs(arg.minX(), wanted.minX()) && !differs(arg.minY(), wanted.minY())
           && !differs(arg.width(), wanted.width()) && !differs(arg.height(), wanted.height());
}

Rect mirrored(Rect frame, double width = 400)
{
    return Rect::make(width - frame.maxX(), frame.minY(), frame.width(), frame.height());
}

struct SharingLayout : Sharing {
    /// Mirrors the window, and gives the frame of a view there.
    Rect frameInMirror(const std::shared_ptr<platform::View>& view)
    {
        window->setRightToLeft(true);
        window->commit();
        const Rect frame = view->frame();
        window->setRightToLeft(false);
        window->commit();
        return frame;
    }
    void expectAt(const std::shared_ptr<platform::View>& view, Rect frame)
    {
        EXPECT_THAT(view->frame(), IsAt(frame));
        EXPECT_THAT(frameInMirror(view), IsAt(mirrored(frame, view->superview()->bounds().width())));
    }
};

TEST_F(SharingLayout, WordsStandBesideThePictureAndTheTextBelowIt)
{
    open({activity("mail")});
    const auto& summary = *sheet->summary();
    expectAt(summary.nameLabel(), Rect::make(100, 16, 252, 22));
    expectAt(summary.detailsLabel(), Rect::make(100, 42, 284, 18));
    expectAt(summary.textLabel(), Rect::make(16, 100, 368, 19));
    expectAt(sheet->closeButton(), Rect::make(352, 4, 44, 44));
    EXPECT_THAT(summary.frame(), IsAt(Rect::make(0, 0, 400, 131)));
    EXPECT_THAT(sheet->list()->frame(), IsAt(Rect::make(0, 131, 400, sheet->view()->bounds().height() - 131)));
    const auto line = std::dynamic_pointer_cast<platform::SurfaceView>(sheet->view()->subviews().back());
    ASSERT_TRUE(line);
    EXPECT_THAT(line->frame(), IsAt(Rect::make(0, 131, 400, 0.5))) << "a pixel between the two";
}

TEST_F(SharingLayout, ThePicturesSquareStandsWhereRowsBegin)
{
    items = {base::Url::fromPath("/tmp/race.mp4")};
    open({activity("mail")});
    media.imageGenerator()->succeed(0, std::make_shared<platform::Image>(platform::Bitmap::transparent(288, 160), 1));
    machine.drain();
    const auto square = sheet->summary()->picture()->superview();
    expectAt(square, Rect::make(16, 16, 72, 72));
    EXPECT_TRUE(square->clipsToBounds());
    EXPECT_NE(square->backgroundColor(), platform::Color::clear()) << "one sees where it will be";
    EXPECT_THAT(sheet->summary()->picture()->frame(), IsAt(Rect::make((72 - 129.6) / 2, 0, 129.6, 72)));
    EXPECT_THAT(sheet->summary()->frame(), IsAt(Rect::make(0, 0, 400, 100)))
        << "without a text there is no room for it";
}

TEST_F(SharingLayout, ManyWordsBesideThePictureMoveTheTextDown)
{
    items = {"A race", base::Url::fromPath("/tmp/a race with a name that is rather long.mp4"),
             base::Url::fromPath("/tmp/some notes that were written while it was raced.txt"),
             base::Url::fromPath("/tmp/b.txt")};
    open({});
    const auto& summary = *sheet->summary();
    expectAt(summary.nameLabel(), Rect::make(100, 16, 252, 43));
    expectAt(summary.detailsLabel(), Rect::make(100, 63, 284, 18));
    expectAt(summary.filesLabel(), Rect::make(100, 85, 284, 35));
    expectAt(summary.textLabel(), Rect::make(16, 132, 368, 19));
    EXPECT_EQ(summary.frame().height(), 163);
}

TEST_F(SharingLayout, WhatStandsAtTheTopTakesItsLinesAndNoMore)
{
    const auto letters = [](std::size_t count) { return std::string(count, 'x'); };
    const auto heightOf = [this](const std::string& name, const std::string& file, const std::string& text) {
        const platform::ShareItems what{text, base::Url::fromPath("/tmp/race.mp4"),
                                        base::Url::fromPath("/tmp/" + file)};
        const auto summary = std::make_shared<platform::ShareSummary>(
            platform::ShareSummary::Services{words, media, files, machine.mainQueue}, what, name);
        summary->setTrailingInset(48);
        return summary->heightThatFits(400);
    };
    const double fixed = 16 + 4 + 18 + 4 + 12 + 12;
    EXPECT_EQ(heightOf(letters(24), letters(60), "x"), fixed + 22 + 35 + 19);
    EXPECT_EQ(heightOf(letters(26), letters(60), "x"), fixed + 43 + 35 + 19);
    EXPECT_EQ(heightOf(letters(110), letters(110), letters(390)), fixed + 43 + 35 + 57) << "the rest is cut off";
    EXPECT_EQ(heightOf(letters(26), letters(26), "x"), fixed + 43 + 18 + 19);
    EXPECT_EQ(heightOf(letters(26), letters(28), "x"), fixed + 43 + 35 + 19);
    EXPECT_EQ(heightOf(letters(26), letters(26), letters(40)), fixed + 43 + 18 + 19);
    EXPECT_EQ(heightOf(letters(26), letters(26), letters(41)), fixed + 43 + 18 + 38);
}

TEST_F(SharingLayout, WordsBeginWhereRowsBeginAndTheLesserOnesStepBack)
{
    open({});
    const auto& summary = *sheet->summary();
    EXPECT_TRUE(summary.nameLabel()->isEmphasized());
    const auto& footer = sheet->list()->footerLabel();
    for (const auto& label :
         {summary.nameLabel(), summary.detailsLabel(), summary.filesLabel(), summary.textLabel(), footer})
        EXPECT_EQ(label->textAlignment(), platform::TextAlignment::Leading);
    EXPECT_EQ(summary.nameLabel()->textColor(), platform::Color::black());
    EXPECT_EQ(summary.textLabel()->textColor(), platform::Color::black());
    for (const auto& label : {summary.detailsLabel(), summary.filesLabel(), footer})
        EXPECT_EQ(label->textColor(), (platform::Color{0, 0, 0, 0.7})) << "no paler: it has to be read";
    EXPECT_EQ(summary.detailsLabel()->numberOfLines(), 1);
    EXPECT_EQ(summary.detailsLabel()->fontSize(), 14);
}

TEST_F(SharingLayout, RowsStandBelowEachOtherAndWhatIsLookedForBehindThem)
{
    make();
    begin();
    provider.found({activity("mail"), activity("message")}, false);
    settle();
    settle();
    window->commit();
    for (std::size_t i = 0; i < 2; ++i)
        EXPECT_THAT(row(i)->frame(), IsAt(Rect::make(0, 8 + 56 * static_cast<double>(i), 400, 56)));
    const auto& footer = sheet->list()->footerLabel();
    expectAt(footer, Rect::make(60, 120 + (56 - 19) / 2.0, 324, 19));
    // Beside it something moves, where the icons of rows are.
    const auto& views = footer->superview()->subviews();
    const auto moving = std::find_if(views.begin(), views.end(), [](const auto& view) {
        return std::dynamic_pointer_cast<platform::ActivityIndicator>(view) != nullptr;
    });
    ASSERT_NE(moving, views.end());
    const auto indicator = std::dynamic_pointer_cast<platform::ActivityIndicator>(*moving);
    expectAt(indicator, Rect::make(16, 120 + 24, 28, 8));
    EXPECT_FALSE(indicator->isHidden());
    EXPECT_TRUE(machine.mainQueue.untilNext()) << "it moves";
    provider.found({}, true);
    EXPECT_TRUE(indicator->isHidden());
    machine.advance(std::chrono::seconds(2));
    EXPECT_FALSE(machine.mainQueue.untilNext()) << "and moves no more";
}

TEST_F(SharingLayout, ThatThereIsNothingStandsWhereRowsBegin)
{
    open({});
    const auto& footer = sheet->list()->footerLabel();
    expectAt(footer, Rect::make(16, 8 + (56 - 38) / 2.0, 368, 38));
    window->transitionToSize({200, 800});
    window->commit();
    EXPECT_EQ(footer->frame().height(), 38) << "no more than two lines";
}

TEST_F(SharingLayout, ASheetHasRoomForSomeRowsBeforeTheyComeAndForAllThatCame)
{
    make();
    EXPECT_EQ(sheet->contentSizeThatFits({400, 2000}).height, 131 + 5 * 56 + 16) << "also before anybody sees it";
    begin();
    const auto height = [this] { return sheet->contentSizeThatFits({400, 2000}).height - 131; };
    EXPECT_EQ(height(), 5 * 56 + 16);
    provider.found({activity("1"), activity("2"), activity("3"), activity("4")}, false);
    EXPECT_EQ(height(), 5 * 56 + 16) << "four rows, and that more are looked for";
    provider.found({activity("5"), activity("6")}, false);
    EXPECT_EQ(height(), 7 * 56 + 16);
    provider.found({}, true);
    EXPECT_EQ(height(), 6 * 56 + 16);
    EXPECT_EQ(sheet->contentSizeThatFits({400, 200}).height, 200) << "no more than there is";
}

TEST_F(SharingLayout, ARowsProgressStandsBelowItsTitleAndBesideItsButton)
{
    open({activity("device")});
    tapRow(0);
    window->commit();
    expectAt(row(0)->cancelButton(), Rect::make(314.8, 6, 77.2, 44));
    expectAt(row(0)->progressView(), Rect::make(60, 44, 246.8, 4));
    EXPECT_NEAR(row(0)->row()->trailingInset(), 93.2, 1e-6) << "the title makes room";
    EXPECT_EQ(row(0)->row()->frame(), Rect::make(0, 0, 400, 56));
    sheet->cancelPressed();
    window->commit();
    EXPECT_EQ(row(0)->row()->trailingInset(), 0);
}

TEST_F(SharingLayout, ALongWordOnTheButtonTakesAThirdOfTheRow)
{
    words.stretched = true;
    window->transitionToSize({300, 800});
    open({activity("device")});
    tapRow(0);
    window->commit();
    EXPECT_THAT(row(0)->cancelButton()->frame(), IsAt(Rect::make(192, 6, 100, 44)));
}

} // namespace

} // namespace tests

// Text on several lines: where it breaks, how it ends, and that it takes the room that was measured for it.
#include "Stage.h"

#include "linux/qt/FontMeasuring.h"
#include "linux/qt/items/Text.h"
#include "platform/views/ListRow.h"

#include <QFontMetricsF>

namespace tests {

namespace {

class Texts : public Stage {
protected:
    const QFont font = qtui::systemFont(15);
    /// Without the marks that give a line its direction.
    std::vector<std::string> lines(const QString& text, double width, int most) const
    {
        std::vector<std::string> plain;
        for (QString line : qtui::wrapped(text, font, width, most))
            plain.push_back(line.remove(QChar(0x200E)).remove(QChar(0x200F)).toStdString());
        return plain;
    }
    double widthOf(const QString& text) const { return QFontMetricsF(font).horizontalAdvance(text); }
};

TEST_F(Texts, BreakBetweenWordsAndAtLineBreaks)
{
    const double width = widthOf("one two ") + 1;
    EXPECT_THAT(lines("one two three", width, 0), testing::ElementsAre("one two", "three"));
    EXPECT_THAT(lines("one\ntwo", width, 0), testing::ElementsAre("one", "two"));
    EXPECT_THAT(lines("one\n\ntwo", width, 0), testing::ElementsAre("one", "", "two"));
    EXPECT_EQ(lines(QString(100, 'w'), width, 0).size(),
              static_cast<std::size_t>(std::ceil(100 / std::floor(width / widthOf("w")))))
        << "a word that is too long breaks anywhere";
}

TEST_F(Texts, EndInAnEllipsisOnlyWhereSomethingIsLeftOver)
{
    const double width = widthOf("one two ") + 1;
    EXPECT_THAT(lines("one two three", width, 2), testing::ElementsAre("one two", "three"));
    const auto cut = lines("one two three four five", width, 2);
    ASSERT_EQ(cut.size(), 2U);
    EXPECT_TRUE(cut[1].ends_with("…")) << cut[1];
    EXPECT_THAT(lines("one\ntwo\nthree", width, 2), testing::ElementsAre("one", "two…"));
    EXPECT_THAT(lines("one\ntwo", width, 2), testing::ElementsAre("one", "two"));
}

TEST_F(Texts, NoLineIsWiderThanItsRoom)
{
    const QString text =
        "A rather long text, with a-long-word-that-goes-on-and-on https://example.org/address and more";
    for (double width = 30; width < 400; width += 17)
        for (const QString& line : qtui::wrapped(text, font, width, 3))
            EXPECT_LE(QFontMetricsF(font).horizontalAdvance(line), width + 0.5) << line.toStdString();
}

TEST_F(Texts, EachLineReadsInTheDirectionOfItsParagraph)
{
    // Arabic first; its second line begins with a Latin word.
    const QString text = QString::fromUtf8("سباق الكرات Marble Racer سباق");
    const auto found = qtui::wrapped(text, font, widthOf(QString::fromUtf8("سباق الكرات ")) + 2, 0);
    ASSERT_GE(found.size(), 2U);
    for (const QString& line : found)
        EXPECT_TRUE(line.isRightToLeft()) << line.toStdString();
    EXPECT_FALSE(qtui::wrapped("Marble", font, 200, 0).front().isRightToLeft());
}

TEST_F(Texts, NamesThatAreIsolatedStaySoOnTheirNextLine)
{
    const auto beginsWith = [](const QString& line, std::initializer_list<char16_t> marks) {
        QString all;
        for (const char16_t mark : marks)
            all += QChar(mark);
        return line.startsWith(all) && line.size() > all.size() && !(line[all.size()].unicode() >> 4 == 0x206);
    };
    const double width = widthOf("three.mp4") + 1;
    const auto found =
        qtui::wrapped(QString::fromUtf8("سباق \u2068one1234 22-11 three.mp4\u2069 سباق"), font, width, 0);
    ASSERT_EQ(found.size(), 5U);
    EXPECT_TRUE(beginsWith(found[0], {0x200F}));
    for (const std::size_t next : {2U, 3U})
        EXPECT_TRUE(beginsWith(found[next], {0x200F, 0x2066})) << "as all of the name, whatever the rest begins with";
    EXPECT_TRUE(beginsWith(found[4], {0x200F})) << "it is over";

    const auto other = qtui::wrapped(QString::fromUtf8("Racer \u2068سباق_سباق Marble\u2069"), font, width, 0);
    ASSERT_GE(other.size(), 3U);
    EXPECT_TRUE(beginsWith(other.back(), {0x200E, 0x2067}));
    EXPECT_TRUE(
        beginsWith(qtui::wrapped(QString::fromUtf8("\u2069one two"), font, widthOf("\u2069one "), 0).back(), {0x200E}))
        << "what was not begun is not over";
}

TEST_F(Texts, TakeTheRoomThatWasMeasuredForThem)
{
    const qtui::FontMeasuring measuring;
    const std::string text = "one two three four five six seven eight nine ten";
    for (const int most : {0, 1, 2, 3}) {
        const auto shown = qtui::wrapped(QString::fromStdString(text), font, 90, most).size();
        EXPECT_EQ(measuring.heightOf(text, {15, false}, 90, most), static_cast<double>(shown) * qtui::lineHeight(font));
    }
    EXPECT_EQ(measuring.heightOf("", {15, false}, 90, 0), 0);
    EXPECT_GE(measuring.widthOf("short\na longer line", {15, false}), widthOf("a longer line"));
    EXPECT_GE(measuring.widthOf("bold", {15, true}), measuring.widthOf("bold", {15, false}));
}

TEST_F(Texts, AreMeasuredByThePresenterOnceThereIsOne)
{
    const auto label = add<platform::Label>(base::Rect::make(0, 0, 90, 20));
    label->setText("one two three four five six");
    label->setFontSize(15);
    label->setNumberOfLines(0);
    EXPECT_EQ(label->heightThatFits(90), qtui::FontMeasuring().heightOf(label->text(), {15, false}, 90, 0));
    presenter.reset();
    EXPECT_EQ(label->heightThatFits(90), platform::EstimatedText().heightOf(label->text(), {15, false}, 90, 0));
}

TEST_F(Texts, OfALabelBeginWhereRowsBegin)
{
    const auto label = add<platform::Label>(base::Rect::make(0, 0, 200, 60));
    label->setText("ab\ncd");
    label->setNumberOfLines(2);
    label->setTextAlignment(platform::TextAlignment::Leading);
    EXPECT_GT(inkIn(base::Rect::make(0, 0, 60, 60)), 20);
    EXPECT_EQ(inkIn(base::Rect::make(140, 0, 60, 60)), 0);
    window->setRightToLeft(true);
    EXPECT_EQ(inkIn(base::Rect::make(0, 0, 60, 60)), 0);
    EXPECT_GT(inkIn(base::Rect::make(140, 0, 60, 60)), 20);
}

TEST_F(Texts, OfALabelThatIsTooLowLeaveWholeLinesOut)
{
    const auto label =
        add<platform::Label>(base::Rect::make(0, 0, 200, 2 * qtui::lineHeight(qtui::systemFont(17)) + 5));
    label->setText("a\nb\nc\nd");
    label->setNumberOfLines(0);
    EXPECT_EQ(inkIn(base::Rect::make(0, label->frame().maxY() + 2, 200, 20)), 0);
}

TEST_F(Texts, OfARowAreMirroredWithIt)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto row = add<platform::ListRow>(base::Rect::make(0, 0, 200, 56));
    row->setTitle("i");
    row->setGlyph("mail");
    EXPECT_GT(inkIn(base::Rect::make(10, 5, 40, 46)), 40) << "the glyph";
    EXPECT_EQ(inkIn(base::Rect::make(150, 5, 40, 46)), 0);
    window->setRightToLeft(true);
    EXPECT_EQ(inkIn(base::Rect::make(10, 5, 40, 46)), 0);
    EXPECT_GT(inkIn(base::Rect::make(150, 5, 40, 46)), 40);
    const QColor before = colorAt(100, 10);
    row->setHighlighted(true);
    EXPECT_NE(colorAt(100, 10), before) << "it shows that it is pressed";
}

} // namespace

} // namespace tests

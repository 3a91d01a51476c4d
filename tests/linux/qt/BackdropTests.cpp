// Blurs: what lies behind shines through, in the shape that masks give.
#include "Stage.h"

#include "linux/qt/SvgImageCatalog.h"

#include <cstdlib>
#include <functional>

namespace tests {

namespace {

class Backdrops : public Stage {
protected:
    explicit Backdrops(double atScale = 1) : Stage(atScale) {}

    std::shared_ptr<platform::BackdropView> addBackdrop(base::Rect frame)
    {
        const auto backdrop = std::make_shared<platform::BackdropView>(platform::BackdropView::kStyleChrome, frame);
        window->addSubview(backdrop);
        return backdrop;
    }
    /// The big play button over whatever is there: a glyph over a disc, both given by masks.
    void addPlayButton(base::Point at)
    {
        qtui::SvgImageCatalog catalog([this] { return scale; });
        const auto glyph = std::make_shared<platform::Button>();
        glyph->setImage(catalog.imageNamed("VKVideoOverlayGlyphMask"), platform::Button::State::Normal);
        const auto disc = std::make_shared<platform::ImageView>(catalog.imageNamed("VKVideoOverlayBackgroundMask"));
        glyph->sizeToFit();
        holder = add<platform::View>({at, glyph->bounds().size});
        const auto backdrop = std::make_shared<platform::BackdropView>(platform::BackdropView::kStyleChrome);
        holder->addSubview(glyph);
        holder->insertSubview_belowSubview(backdrop, glyph);
        holder->addSubview(disc);
        disc->setBackdropMaskFlags(7);
        disc->setAlpha(0);
        backdrop->updateMaskViewsFor(disc);
        glyph->setBackdropMaskFlags(3);
        backdrop->updateMaskViewsFor(glyph);
        glyph->setAlpha(0.3);
    }

    std::shared_ptr<platform::View> holder;
};

class BackdropsAtTwo : public Backdrops {
protected:
    BackdropsAtTwo() : Backdrops(2) {}
};

double distance(const QColor& a, const QColor& b)
{
    return std::abs(a.red() - b.red()) + std::abs(a.green() - b.green()) + std::abs(a.blue() - b.blue());
}

TEST_F(Backdrops, AStripShowsThePictureBehindItBlurred)
{
    addPlayer(base::Rect::make(0, 0, 200, 100), std::make_shared<QuarteredFrame>(base::Size{200, 100}));
    addBackdrop(base::Rect::make(0, 0, 200, 38));
    const QColor left = colorAt(20, 20);
    const QColor right = colorAt(180, 20);
    EXPECT_GT(left.red(), left.green() + 40);
    EXPECT_GT(right.green(), right.red() + 40);
    // What was a sharp edge is a slope.
    EXPECT_GT(distance(colorAt(98, 20), colorAt(102, 20)), 2);
    EXPECT_LT(distance(colorAt(98, 20), colorAt(102, 20)), 80);
    EXPECT_EQ(colorAt(50, 39), QColor(255, 0, 0));
}

TEST_F(Backdrops, ABlurFollowsThePicture)
{
    const auto player =
        addPlayer(base::Rect::make(0, 0, 200, 100),
                  std::make_shared<FakeVideoFrame>(base::MediaTime::zero(), base::Size{2, 1}, 0xffff0000));
    addBackdrop(base::Rect::make(0, 0, 200, 38));
    EXPECT_GT(colorAt(100, 20).red(), colorAt(100, 20).blue() + 40);
    player->show(std::make_shared<FakeVideoFrame>(base::MediaTime::zero(), base::Size{2, 1}, 0xff0000ff));
    EXPECT_GT(colorAt(100, 20).blue(), colorAt(100, 20).red() + 40);
}

TEST_F(Backdrops, OnlyWhatLiesBehindIsBlurred)
{
    addColor(base::Rect::make(0, 0, 200, 100), kRed);
    const auto backdrop = addBackdrop(base::Rect::make(0, 0, 200, 38));
    const QColor before = colorAt(100, 20);
    addColor(base::Rect::make(0, 0, 20, 20), kBlue);
    EXPECT_EQ(colorAt(100, 20), before);
    EXPECT_EQ(colorAt(10, 10), QColor(0, 0, 255));
}

TEST_F(Backdrops, AnInvisibleBackdropIsNotBlurred)
{
    const auto player = addPlayer(base::Rect::make(0, 0, 200, 100),
                                  std::make_shared<FakeVideoFrame>(base::MediaTime::zero(), base::Size{2, 1}));
    const auto backdrop = addBackdrop(base::Rect::make(0, 0, 200, 38));
    backdrop->setAlpha(0);
    look();
    const auto blurs = presenter->statistics().blurs;
    player->show(std::make_shared<FakeVideoFrame>(base::MediaTime::zero(), base::Size{2, 1}));
    look();
    EXPECT_EQ(presenter->statistics().blurs, blurs);
    backdrop->setAlpha(1);
    look();
    EXPECT_EQ(presenter->statistics().blurs, blurs + 1);
}

TEST_F(Backdrops, AWeakDeviceGetsAPlainTint)
{
    presenter->setLiveBlur(false);
    addPlayer(base::Rect::make(0, 0, 200, 100), std::make_shared<QuarteredFrame>(base::Size{200, 100}));
    addBackdrop(base::Rect::make(0, 0, 200, 38));
    EXPECT_EQ(presenter->statistics().blurs, 0U);
    EXPECT_LT(distance(colorAt(50, 20), colorAt(150, 20)), 40) << "which hides what a blur would have softened";
    EXPECT_GT(colorAt(50, 20).lightness(), 220);
}

void expectDisc(const std::function<QColor(double, double)>& colorAt, base::Point at, const QColor& ground)
{
    for (const base::Point corner : {base::Point{3, 3}, {84, 3}, {3, 84}, {84, 84}})
        EXPECT_EQ(colorAt(at.x + corner.x, at.y + corner.y), ground) << "outside of the disc";
    const QColor disc = colorAt(at.x + 44, at.y + 12);
    const QColor glyph = colorAt(at.x + 44, at.y + 44);
    EXPECT_EQ(colorAt(at.x + 10, at.y + 44), disc) << "the disc is even";
    EXPECT_EQ(colorAt(at.x + 78, at.y + 44), disc);
    EXPECT_GE(contrast(disc, glyph), 3) << "the glyph stands out";
}

TEST_F(Backdrops, MasksCutADiscAndDarkenItsGlyph)
{
    const auto ground = addColor(base::Rect::make(0, 0, 200, 100), kRed);
    addPlayButton({60, 6});
    for (const auto& color : {kRed, kBlue, platform::Color::black(), platform::Color::white(1)}) {
        ground->setBackgroundColor(color);
        expectDisc([this](double x, double y) { return colorAt(x, y); }, {60, 6}, qtui::toQColor(color));
    }
}

TEST_F(BackdropsAtTwo, MasksCutADiscAtTwoPixelsAPoint)
{
    addColor(base::Rect::make(0, 0, 200, 100), kBlue);
    addPlayButton({60, 6});
    expectDisc([this](double x, double y) { return colorAt(x, y); }, {60, 6}, QColor(0, 0, 255));
}

TEST_F(Backdrops, TheDiscGoesWithTheButton)
{
    addColor(base::Rect::make(0, 0, 200, 100), kRed);
    addPlayButton({60, 6});
    EXPECT_NE(colorAt(104, 18), QColor(255, 0, 0));
    holder->removeFromSuperview();
    EXPECT_EQ(colorAt(104, 18), QColor(255, 0, 0));
}

TEST_F(Backdrops, TheMasksAreDrawnForTheScreen)
{
    qtui::SvgImageCatalog catalog([] { return 3.0; });
    const auto disc = catalog.imageNamed("VKVideoOverlayBackgroundMask");
    ASSERT_TRUE(disc);
    EXPECT_EQ(disc->scale(), 3);
    EXPECT_EQ(disc->bitmap().width, 264);
    EXPECT_EQ(disc->size(), (base::Size{88, 88}));
    EXPECT_EQ(disc->bitmap().at(0, 0)[3], 255) << "opaque outside of the disc";
    EXPECT_EQ(disc->bitmap().at(132, 132)[3], 0) << "transparent inside";
    EXPECT_EQ(catalog.imageNamed("VKVideoOverlayBackgroundMask"), disc);
    EXPECT_EQ(catalog.imageNamed("no such picture"), nullptr);
}

} // namespace

} // namespace tests

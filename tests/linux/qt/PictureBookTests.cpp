// The whole screen as people see it: on a phone and on a tablet, light and dark. CLIPSA_GRABS names a directory for the
// pictures.
#include "Stage.h"
#include "linux/qt/items/Text.h"

#include "linux/qt/SvgImageCatalog.h"

#include <cmath>

namespace tests {

namespace {

using platform::BarButtonItem;
using Kind = BarButtonItem::Kind;

/// Something like a game: a sky, hills, and a bright and a dark corner.
class Landscape final : public platform::VideoFrame {
public:
    explicit Landscape(base::Size size) : m_size(size) {}

    base::MediaTime time() const override { return base::MediaTime::zero(); }
    base::Size displaySize() const override { return m_size; }
    bool render(std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height, Quality) const override
    {
        for (int y = 0; y < height; ++y)
            for (int x = 0; x < width; ++x) {
                const double u = (x + 0.5) / width;
                const double v = (y + 0.5) / height;
                const double hill = 0.62 + 0.1 * std::sin(u * 7) + 0.04 * std::sin(u * 23);
                const double sun = std::exp(-60 * ((u - 0.75) * (u - 0.75) + (v - 0.2) * (v - 0.2)));
                const bool ground = v > hill;
                const double shade = ground ? (v - hill) * 1.6 : 0;
                const auto put = [&](int i, double value) {
                    bgra[y * bytesPerRow + x * 4 + i] =
                        static_cast<std::uint8_t>(255 * std::clamp(value + sun, 0.0, 1.0));
                };
                put(0, ground ? 0.25 - shade * 0.4 : 0.85 - v * 0.3);
                put(1, ground ? 0.6 - shade : 0.55 + v * 0.3);
                put(2, ground ? 0.3 - shade * 0.5 : 0.3 + v * 0.7);
                bgra[y * bytesPerRow + x * 4 + 3] = 255;
            }
        return true;
    }

private:
    base::Size m_size;
};

class PictureBook : public Stage {
protected:
    explicit PictureBook(double atScale = 1) : Stage(atScale) {}

    void fill(base::Size size, bool wide)
    {
        resize(size);
        clock.advance(std::chrono::seconds(1));
        addPlayer({{0, 0}, size}, std::make_shared<Landscape>(base::Size{1080, 2160}));
        addBars(size, wide);
        addStrip(size, wide);
        addPlayButton(size);
        settle();
    }
    std::shared_ptr<BarButtonItem> item(Kind kind)
    {
        return std::make_shared<BarButtonItem>(words, kind, target, Target::action());
    }
    void addBars(base::Size size, bool wide)
    {
        const auto title = std::make_shared<platform::Label>(base::Rect::make(0, 0, 120, 17));
        title->setText("Marble Racer");
        title->setFontSize(15);
        title->setTextAlignment(platform::TextAlignment::Center);
        const auto date = std::make_shared<platform::Label>(base::Rect::make(0, 17, 120, 17));
        date->setText("12 May 2024, 18:04");
        date->setFontSize(10);
        date->setTextAlignment(platform::TextAlignment::Center);
        title->addSubview(date);
        const auto flexible = BarButtonItem::flexibleSpace();
        top = add<platform::Toolbar>(base::Rect::make(0, 0, size.width, 60));
        const auto share = item(Kind::Action);
        const auto play = item(Kind::Play);
        platform::Toolbar::Items items{item(Kind::Cancel), flexible, BarButtonItem::withCustomView(title), flexible};
        if (wide) {
            share->setImageInsets({5, 0, -5, 0});
            play->setImageInsets({8, 0, -8, 0});
            items.insert(items.end(), {play, share});
        }
        items.push_back(item(Kind::Save));
        top->setItems(items);
        if (wide)
            return;
        bottom = add<platform::Toolbar>(base::Rect::make(0, size.height - 44, size.width, 44));
        bottom->setItems({share, flexible, item(Kind::Pause), flexible});
    }
    void addStrip(base::Size size, bool wide)
    {
        const double y = size.height - (wide ? 0 : 44) - 38;
        const auto backdrop = std::make_shared<platform::BackdropView>(platform::BackdropView::kStyleChrome,
                                                                       base::Rect::make(0, y, size.width, 38));
        window->addSubview(backdrop);
        scrubber = std::make_shared<platform::MovieScrubber>(words);
        scrubber->setFrame(base::Rect::make(0, 0, size.width, 38));
        scrubber->setEdgeInset(10);
        scrubber->setEditable(true);
        scrubber->setZoomDelay(0.5);
        scrubber->setDataSource(movie);
        backdrop->addSubview(scrubber);
        scrubber->reloadData();
        scrubber->setValue(4);
    }
    void addThumbnails()
    {
        Landscape landscape({1, 1});
        const int side = 60;
        for (const double timestamp : scrubber->timestamps()) {
            platform::Bitmap bitmap = platform::Bitmap::transparent(side, side);
            landscape.render(bitmap.rgba.data(), side * 4, side, side, platform::VideoFrame::Quality::Exact);
            for (std::size_t i = 0; i + 3 < bitmap.rgba.size(); i += 4)
                std::swap(bitmap.rgba[i], bitmap.rgba[i + 2]);
            scrubber->setThumbnailImage_forTimestamp(std::make_shared<platform::Image>(std::move(bitmap), 1),
                                                     timestamp);
        }
    }
    void addPlayButton(base::Size size)
    {
        qtui::SvgImageCatalog catalog([this] { return scale; });
        const auto glyph = std::make_shared<platform::Button>();
        glyph->setImage(catalog.imageNamed("VKVideoOverlayGlyphMask"), platform::Button::State::Normal);
        glyph->sizeToFit();
        const auto disc = std::make_shared<platform::ImageView>(catalog.imageNamed("VKVideoOverlayBackgroundMask"));
        const auto holder = add<platform::View>(base::Rect::make(size.width / 2 - 44, size.height / 2 - 44, 88, 88));
        const auto backdrop = std::make_shared<platform::BackdropView>(platform::BackdropView::kStyleChrome);
        holder->addSubview(backdrop);
        holder->addSubview(glyph);
        holder->addSubview(disc);
        disc->setBackdropMaskFlags(7);
        disc->setAlpha(0);
        backdrop->updateMaskViewsFor(disc);
        glyph->setBackdropMaskFlags(3);
        backdrop->updateMaskViewsFor(glyph);
        glyph->setAlpha(0.3);
    }
    /// Nothing of the chrome may be cut off, and all of it can be reached by keys.
    void expectWhole()
    {
        for (int i = 0; i < 12; ++i) {
            window->moveFocus(true);
            const auto view = window->focusedView();
            ASSERT_TRUE(view);
            const base::Point corner = view->convertToRoot({});
            EXPECT_GE(corner.x, 0);
            EXPECT_LE(corner.x + view->bounds().width(), window->bounds().size.width);
            EXPECT_GE(view->bounds().height(), 38) << "room for a thumb";
        }
        window->clearFocus();
    }

    std::shared_ptr<Target> target = std::make_shared<Target>();
    std::shared_ptr<Movie> movie = std::make_shared<Movie>();
    std::shared_ptr<platform::Toolbar> top;
    std::shared_ptr<platform::Toolbar> bottom;
    std::shared_ptr<platform::MovieScrubber> scrubber;
};

class PictureBookAtTwo : public PictureBook {
protected:
    PictureBookAtTwo() : PictureBook(2) {}
};

TEST_F(PictureBookAtTwo, APhoneInALanguageOfLongWords)
{
    words.stretched = true;
    fill({360, 640}, false);
    const auto title = top->items()[2];
    const auto flexible = BarButtonItem::flexibleSpace();
    const std::vector<platform::Toolbar::Items> rows = {
        {item(Kind::Cancel), flexible, title, flexible, item(Kind::Save)},
        {item(Kind::Cancel), flexible, title, flexible, item(Kind::Done)},
        {item(Kind::Undo), flexible, title, flexible, item(Kind::Save)}};
    for (const auto& row : rows) {
        top->setItems(row);
        settle();
        for (const auto& each : row) {
            const auto button = std::dynamic_pointer_cast<platform::Button>(each->view());
            if (!button)
                continue;
            const auto weight = button->isEmphasized() ? QFont::DemiBold : QFont::Normal;
            const QString text = QString::fromStdString(button->title());
            const double room = button->bounds().width();
            const qtui::TextLine line = qtui::squeezed({text, qtui::systemFont(17, weight)}, room);
            EXPECT_EQ(line.text, text) << "it is cut off in " << room << " points";
            EXPECT_LE(button->frame().maxX(), 360);
        }
        EXPECT_GE(title->view()->bounds().width(), 100) << "there is room for the title";
    }
    keep("phone-long-words");
}

TEST_F(PictureBookAtTwo, APhoneFromRightToLeft)
{
    window->setRightToLeft(true);
    fill({360, 720}, false);
    look();
    const auto cancel = top->items().front()->view();
    EXPECT_GT(cancel->frame().minX(), 180);
    EXPECT_LT(scrubber->playHeadX(), 180) << "time runs as it does everywhere";
    expectWhole();
    keep("phone-right-to-left");
}

TEST_F(PictureBookAtTwo, APhone)
{
    fill({360, 720}, false);
    keep("phone-light");
    addThumbnails();
    window->moveFocus(true);
    keep("phone-light-focus");
    window->moveFocus(false);
    presenter->setScheme(qtui::Scheme::Dark);
    keep("phone-dark-scrubber-focus");
    window->clearFocus();
    scrubber->setHighlighted(true);
    top->setAlpha(0.5);
    keep("phone-dark-held-half");
    top->setAlpha(1);
    scrubber->setHighlighted(false);
    scrubber->moveHandle(platform::ScrubberHandle::Start, 3);
    scrubber->moveHandle(platform::ScrubberHandle::End, 8);
    scrubber->setValue(5);
    keep("phone-dark-trim");
    presenter->setScheme(qtui::Scheme::Light);
    keep("phone-light-trim");
    expectWhole();
}

TEST_F(PictureBook, ATablet)
{
    fill({1024, 600}, true);
    addThumbnails();
    keep("tablet-light");
    presenter->setScheme(qtui::Scheme::Dark);
    presenter->setLiveBlur(false);
    keep("tablet-dark-plain");
    scrubber->moveHandle(platform::ScrubberHandle::Start, 3);
    keep("tablet-dark-trim");
    presenter->setScheme(qtui::Scheme::Light);
    look();
    const double y = scrubber->convertToRoot({0, 19}).y;
    window->touchDown({1, {scrubber->startHandle()->frame().center().x, y}, {}});
    clock.advance(std::chrono::milliseconds(500));
    mainQueue.drain();
    keep("tablet-light-zoomed");
    window->touchCancel({1, {}, {}});
    expectWhole();
}

} // namespace

} // namespace tests

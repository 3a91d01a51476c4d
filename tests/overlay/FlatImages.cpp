// The pictures of the flat look, which are drawn once out of two masks.
#include "overlay/VKFlatVideoOverlayButton.h"
#include "support/FakePlatform.h"

#include <gtest/gtest.h>

#include <array>
#include <string>
#include <string_view>
#include <utility>

using platform::Button;

namespace {

using FlatButton = VKFlatVideoOverlayButton;

const std::uint8_t* pixel(const platform::ImageRef& image, int x, int y)
{
    return image->bitmap().at(x, y);
}

class FlatImages : public testing::Test {
protected:
    tests::FakePlatform fake;

    std::shared_ptr<FlatButton> make() { return FlatButton::initWithStyle(fake.platform, 2); }
    struct Masks {
        platform::ImageRef disc, glyph;
    };
    /// A white, opaque disc with an opaque glyph.
    platform::ImageRef drawnWith(const Masks& masks)
    {
        struct Catalog final : platform::ImageCatalog {
            explicit Catalog(const Masks& theMasks) : masks(theMasks) {}
            platform::ImageRef imageNamed(std::string_view name) override
            {
                return name == "VKVideoOverlayGlyphMask" ? masks.glyph : masks.disc;
            }
            const Masks& masks;
        } images(masks);
        const platform::Platform platform{
            fake.machine.system, fake.notifications, fake.device, *fake.window, images,     fake.files,  fake.bundles,
            fake.words,          fake.calendar,      fake.media,  fake.photos,  fake.store, fake.sharing};
        return FlatButton::_createOverlayImageWithBackgroundWhite_backgroundAlpha_glyphAlpha(platform, 1, 1, 1);
    }
};

} // namespace

TEST_F(FlatImages, AreTheSameOnesForTwoButtons)
{
    const auto one = make();
    const auto other = make();
    for (const auto state : {Button::State::Normal, Button::State::Highlighted}) {
        ASSERT_TRUE(one->image(state));
        EXPECT_EQ(one->image(state), other->image(state));
    }
    EXPECT_NE(one->image(Button::State::Normal), one->image(Button::State::Highlighted));
}

TEST_F(FlatImages, AreDrawnOnceAProcess)
{
    make();
    const int drawn = fake.images.drawn;
    make();
    EXPECT_EQ(fake.images.drawn, drawn);
}

TEST_F(FlatImages, AreADiscWithTheGlyphPunchedOutAndDrawnBackInFaintly)
{
    const auto image =
        FlatButton::_createOverlayImageWithBackgroundWhite_backgroundAlpha_glyphAlpha(fake.platform, 1.0, 0.5, 0.25);
    EXPECT_EQ(image->size(), (base::Size{80, 80}));
    // Outside the disc nothing, in the disc half-opaque white (premultiplied), in the glyph a quarter of black.
    EXPECT_EQ(pixel(image, 2, 2)[3], 0);
    EXPECT_NEAR(pixel(image, 15, 15)[3], 128, 1);
    EXPECT_NEAR(pixel(image, 15, 15)[0], 128, 1);
    EXPECT_NEAR(pixel(image, 40, 40)[3], 64, 1);
    EXPECT_EQ(pixel(image, 40, 40)[0], 0);
}

TEST_F(FlatImages, AreAGreyDiscWhoseGlyphIsDarkerWhilePressed)
{
    using Bytes = std::array<int, 4>; // blue, green, red, opacity; the first three multiplied by the last
    const auto at = [](const platform::ImageRef& image, int x, int y) {
        const std::uint8_t* bytes = pixel(image, x, y);
        return Bytes{bytes[0], bytes[1], bytes[2], bytes[3]};
    };
    const auto button = make();
    for (const auto& [state, glyph] :
         {std::pair(Button::State::Normal, 77), std::pair(Button::State::Highlighted, 128)}) {
        const auto image = button->image(state);
        EXPECT_EQ(at(image, 2, 2), (Bytes{0, 0, 0, 0})) << "outside";
        EXPECT_EQ(at(image, 15, 15), (Bytes{235, 235, 235, 245})) << "the disc";
        EXPECT_EQ(at(image, 40, 40), (Bytes{0, 0, 0, glyph})) << "the glyph";
    }
}

TEST_F(FlatImages, TakeTheirMasksAsTheyAreAndWhereTheyAre)
{
    // The disc's is half opaque on the right, the glyph's half black at the bottom.
    Masks masks;
    platform::Canvas disc({8, 8}, 1);
    disc.fill({{4, 0}, {4, 8}}, 0, 0.5);
    masks.disc = disc.image();
    platform::Canvas glyph({8, 8}, 1);
    glyph.fill({{0, 4}, {8, 4}}, 0, 0.5);
    masks.glyph = glyph.image();
    const auto image = drawnWith(masks);
    ASSERT_EQ(image->size(), (base::Size{8, 8}));
    for (int y = 0; y < 8; ++y)
        for (int x = 0; x < 8; ++x) {
            SCOPED_TRACE(std::to_string(x) + ", " + std::to_string(y));
            const double white = (x < 4 ? 1 : 0.5) * (y < 4 ? 1 : 0.25); // punched out by half, and half of it covered
            EXPECT_NEAR(pixel(image, x, y)[0], 255 * white, 2);
            EXPECT_NEAR(pixel(image, x, y)[3], 255 * (white + (y < 4 ? 0 : 0.5)), 2);
        }
}

TEST_F(FlatImages, WithoutOneOfTheirMasksAreNone)
{
    const auto mask = platform::Canvas({8, 8}, 1).image();
    EXPECT_NE(drawnWith({.disc = mask, .glyph = mask}), nullptr);
    EXPECT_EQ(drawnWith({.disc = mask, .glyph = nullptr}), nullptr);
    EXPECT_EQ(drawnWith({.disc = nullptr, .glyph = mask}), nullptr);
}

TEST_F(FlatImages, AreDrawnAtTheScreensScale)
{
    fake.window->setScale(2);
    const auto image =
        FlatButton::_createOverlayImageWithBackgroundWhite_backgroundAlpha_glyphAlpha(fake.platform, 1.0, 0.5, 0.25);
    EXPECT_EQ(image->bitmap().width, 160);
    EXPECT_EQ(image->size(), (base::Size{80, 80}));
}

#include "platform/views/Canvas.h"

#include <gmock/gmock.h>

#include <array>

namespace {

using base::Rect;
using platform::Bitmap;
using platform::BlendMode;
using platform::Canvas;
using platform::Image;
using Pixel = std::array<int, 4>;

Pixel at(const platform::ImageRef& image, int x, int y)
{
    const auto* pixel = image->bitmap().at(x, y);
    return {pixel[0], pixel[1], pixel[2], pixel[3]};
}

Image plain(int width, int height, Pixel colour, double scale = 1)
{
    Bitmap bitmap = Bitmap::transparent(width, height);
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x)
            for (std::size_t i = 0; i < 4; ++i)
                bitmap.at(x, y)[i] = static_cast<std::uint8_t>(colour[i]);
    return {std::move(bitmap), scale};
}

TEST(CanvasTests, IsTransparentAtFirstAndRoundedUpToWholePixels)
{
    const auto image = Canvas({10.1, 5}, 2).image();
    EXPECT_EQ(image->bitmap().width, 21);
    EXPECT_EQ(image->bitmap().height, 10);
    EXPECT_EQ(image->scale(), 2);
    EXPECT_EQ(at(image, 20, 9), (Pixel{0, 0, 0, 0}));
    EXPECT_EQ(Canvas({0.1 * 3 * 10, 1}, 1).image()->bitmap().width, 3);
    EXPECT_EQ(Canvas({0, -1}, 1).image()->bitmap().width, 0);
}

TEST(CanvasTests, FillingReplacesWhatWasThere)
{
    Canvas canvas({4, 4}, 1);
    canvas.fill(Rect::make(0, 0, 4, 4), 1, 1);
    canvas.fill(Rect::make(1, 1, 100, 2), 1, 0.5);
    const auto image = canvas.image();
    EXPECT_EQ(at(image, 0, 0), (Pixel{255, 255, 255, 255}));
    EXPECT_EQ(at(image, 1, 1), (Pixel{128, 128, 128, 128}));
    EXPECT_EQ(at(image, 3, 2), (Pixel{128, 128, 128, 128}));
    EXPECT_EQ(at(image, 1, 3), (Pixel{255, 255, 255, 255}));
}

TEST(CanvasTests, DrawingOverRoundsToTheNearest)
{
    Canvas canvas({1, 1}, 1);
    canvas.fill(Rect::make(0, 0, 1, 1), 1, 1);
    canvas.draw(plain(1, 1, {100, 0, 0, 100}), {}, BlendMode::SourceOver, 1);
    EXPECT_EQ(at(canvas.image(), 0, 0), (Pixel{255, 155, 155, 255}));
    canvas.draw(plain(1, 1, {0, 0, 0, 255}), {}, BlendMode::SourceOver, 0.5);
    EXPECT_EQ(at(canvas.image(), 0, 0), (Pixel{128, 78, 78, 255}));
}

TEST(CanvasTests, DrawingOutErasesWhereTheImageIs)
{
    Canvas canvas({2, 1}, 1);
    canvas.fill(Rect::make(0, 0, 2, 1), 0, 0.6);
    canvas.draw(plain(1, 1, {0, 0, 0, 255}), {}, BlendMode::DestinationOut, 1);
    EXPECT_EQ(at(canvas.image(), 0, 0), (Pixel{0, 0, 0, 0}));
    EXPECT_EQ(at(canvas.image(), 1, 0), (Pixel{0, 0, 0, 153}));
    canvas.draw(plain(1, 1, {9, 9, 9, 255}), {1, 0}, BlendMode::DestinationOut, 0.5);
    EXPECT_EQ(at(canvas.image(), 1, 0), (Pixel{0, 0, 0, 77}));
}

TEST(CanvasTests, ImagesAreClippedToTheCanvas)
{
    Canvas canvas({2, 2}, 1);
    canvas.draw(plain(3, 3, {1, 2, 3, 255}), {1, 1}, BlendMode::SourceOver, 1);
    canvas.draw(plain(3, 3, {9, 9, 9, 255}), {-3, -3}, BlendMode::SourceOver, 1);
    canvas.draw(plain(3, 3, {9, 9, 9, 255}), {20, 20}, BlendMode::SourceOver, 1);
    EXPECT_EQ(at(canvas.image(), 1, 1), (Pixel{1, 2, 3, 255}));
    EXPECT_EQ(at(canvas.image(), 0, 0), (Pixel{0, 0, 0, 0}));
}

TEST(CanvasTests, AnImageOfAnotherScaleKeepsItsSizeInPoints)
{
    Canvas large({4, 4}, 2);
    large.draw(plain(2, 2, {200, 200, 200, 255}), {1, 1}, BlendMode::SourceOver, 1);
    const auto grown = large.image();
    EXPECT_EQ(at(grown, 1, 1), (Pixel{0, 0, 0, 0}));
    EXPECT_EQ(at(grown, 2, 2), (Pixel{200, 200, 200, 255}));
    EXPECT_EQ(at(grown, 5, 5), (Pixel{200, 200, 200, 255}));
    EXPECT_EQ(at(grown, 6, 6), (Pixel{0, 0, 0, 0}));

    Bitmap checks = Bitmap::transparent(2, 2);
    checks.at(0, 0)[3] = 255;
    checks.at(1, 1)[3] = 255;
    Canvas small({1, 1}, 1);
    small.draw(Image(std::move(checks), 2), {}, BlendMode::SourceOver, 1);
    EXPECT_EQ(at(small.image(), 0, 0), (Pixel{0, 0, 0, 128}));
}

TEST(CanvasTests, HalfAPixelCoversHalf)
{
    Canvas canvas({2, 1}, 1);
    canvas.draw(plain(1, 1, {0, 0, 0, 255}), {0.5, 0}, BlendMode::SourceOver, 1);
    EXPECT_EQ(at(canvas.image(), 0, 0), (Pixel{0, 0, 0, 128}));
    EXPECT_EQ(at(canvas.image(), 1, 0), (Pixel{0, 0, 0, 128}));
}

} // namespace

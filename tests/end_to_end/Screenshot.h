/// A picture of the editor's window, and what a movie's picture on it says.
#pragma once

#include <QColor>
#include <QImage>
#include <QRectF>

#include <filesystem>
#include <string>

namespace tests {

/// How a movie's picture is turned when it is shown.
enum class Turn { None, Clockwise, Counterclockwise };

/// A movie's picture as it is coded, in pixels, and how it is turned.
struct Coded {
    int width = 640;
    int height = 360;
    Turn turn = Turn::None;
};

class Screenshot {
public:
    explicit Screenshot(const QImage& image) : m_image(image.convertToFormat(QImage::Format_RGB32)) {}
    /// Null when there is no such picture.
    explicit Screenshot(const std::filesystem::path& file) : Screenshot(QImage(QString::fromStdString(file.native())))
    {
    }

    bool isNull() const { return m_image.isNull(); }
    int width() const { return m_image.width(); }
    int height() const { return m_image.height(); }
    QColor at(double x, double y) const { return m_image.pixelColor(static_cast<int>(x), static_cast<int>(y)); }
    /// The colour at that place of a movie that is fitted into the window.
    QColor at(const Coded& coded, double x, double y) const;
    /// The number that the movie's squares say (tests/movies/README.md).
    int number(const Coded& coded) const;

    const QImage& image() const { return m_image; }

private:
    QImage m_image;
};

/// Whether all three colours are as near as that.
bool isNear(const QColor& one, const QColor& other, int distance);
std::string words(const QColor& colour);

/// How different two pictures of one size are, both of four bytes a pixel: the largest difference of the average colours
/// of a small square, 0 to 255. Letters that are drawn a little otherwise keep their average; one that is missing does not.
double differenceOf(const QImage& one, const QImage& other);

} // namespace tests

/// Points, sizes, rectangles and transforms, in points unless said otherwise; y grows downwards.
#pragma once

#include <limits>

namespace base {

struct Point {
    double x = 0;
    double y = 0;
    friend bool operator==(const Point&, const Point&) = default;
};

struct Size {
    double width = 0;
    double height = 0;
    friend bool operator==(const Size&, const Size&) = default;
};

struct Rect {
    Point origin;
    Size size;

    static Rect make(double x, double y, double width, double height) { return {{x, y}, {width, height}}; }
    /// The rectangle that is nowhere: empty, and equal to no rectangle that is somewhere.
    static Rect null()
    {
        constexpr double kInfinity = std::numeric_limits<double>::infinity();
        return {{kInfinity, kInfinity}, {0, 0}};
    }

    double minX() const { return origin.x; }
    double minY() const { return origin.y; }
    double maxX() const { return origin.x + size.width; }
    double maxY() const { return origin.y + size.height; }
    double width() const { return size.width; }
    double height() const { return size.height; }
    Point center() const { return {origin.x + size.width / 2, origin.y + size.height / 2}; }

    bool isNull() const { return origin.x == std::numeric_limits<double>::infinity(); }
    /// Null, or without area.
    bool isEmpty() const { return isNull() || !(size.width > 0) || !(size.height > 0); }
    /// Left and top edges belong to the rectangle, right and bottom ones do not.
    bool contains(Point point) const
    {
        return point.x >= minX() && point.x < maxX() && point.y >= minY() && point.y < maxY();
    }
    /// Grown by `by` on every side.
    Rect outset(double by) const
    {
        return {{origin.x - by, origin.y - by}, {size.width + 2 * by, size.height + 2 * by}};
    }

    friend bool operator==(const Rect&, const Rect&) = default;
};

struct EdgeInsets {
    double top = 0;
    double left = 0;
    double bottom = 0;
    double right = 0;
    friend bool operator==(const EdgeInsets&, const EdgeInsets&) = default;
};

/// x' = a·x + c·y + tx, y' = b·x + d·y + ty.
struct AffineTransform {
    double a = 1;
    double b = 0;
    double c = 0;
    double d = 1;
    double tx = 0;
    double ty = 0;

    Point apply(Point p) const { return {a * p.x + c * p.y + tx, b * p.x + d * p.y + ty}; }
    /// A size has no position: translation does not touch it. Components can come out negative.
    Size apply(Size s) const { return {a * s.width + c * s.height, b * s.width + d * s.height}; }

    friend bool operator==(const AffineTransform&, const AffineTransform&) = default;
};

} // namespace base

/// Rational time of a movie: `value / timescale` seconds, exact where decimal seconds are not.
#pragma once

#include <compare>
#include <cstdint>

namespace base {

struct MediaTime {
    enum class Kind : std::uint8_t { Invalid, Numeric, Indefinite, PositiveInfinity, NegativeInfinity };

    std::int64_t value = 0;
    std::int32_t timescale = 0; ///< ticks a second; 0 in a time that is not valid
    Kind kind = Kind::Invalid;

    /// `timescale` must be positive; otherwise the time is invalid.
    static MediaTime make(std::int64_t value, std::int32_t timescale);
    /// The nearest tick, halves away from zero. Invalid when `seconds` is not a number or `timescale` not positive.
    static MediaTime fromSeconds(double seconds, std::int32_t timescale);
    static MediaTime invalid() { return {}; }
    static MediaTime zero() { return make(0, 1); }
    static MediaTime indefinite() { return {0, 0, Kind::Indefinite}; }
    static MediaTime positiveInfinity() { return {0, 0, Kind::PositiveInfinity}; }

    bool isValid() const { return kind != Kind::Invalid; }
    /// Valid, and neither infinite nor indefinite.
    bool isNumeric() const { return kind == Kind::Numeric; }

    /// NaN when invalid or indefinite.
    double seconds() const;

    /// The same moment in other ticks, rounded to the nearest, halves away from zero.
    MediaTime convertedTo(std::int32_t newTimescale) const;

    /// Exact, across timescales. Times that are not numeric are unordered, but infinities compare as expected.
    friend std::partial_ordering operator<=>(const MediaTime& a, const MediaTime& b);
    friend bool operator==(const MediaTime& a, const MediaTime& b) { return (a <=> b) == 0; }

    /// Sum and difference, exact in the finer common scale where it fits, else in `a`'s.
    friend MediaTime operator+(const MediaTime& a, const MediaTime& b);
    friend MediaTime operator-(const MediaTime& a, const MediaTime& b);
};

/// From `start`, lasting `duration`.
struct MediaTimeRange {
    MediaTime start;
    MediaTime duration;

    MediaTime end() const { return start + duration; }
};

} // namespace base

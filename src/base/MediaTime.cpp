#include "base/MediaTime.h"

#include <cmath>
#include <initializer_list>
#include <limits>
#include <numeric>

namespace base {

namespace {

__extension__ using Wide = __int128;

Wide rounded(Wide numerator, Wide denominator)
{
    const Wide half = denominator / 2;
    return (numerator >= 0 ? numerator + half : numerator - half) / denominator;
}

MediaTime fromWide(Wide value, std::int32_t timescale)
{
    if (value > std::numeric_limits<std::int64_t>::max() || value < std::numeric_limits<std::int64_t>::min())
        return MediaTime::invalid();
    return MediaTime::make(static_cast<std::int64_t>(value), timescale);
}

/// What is invalid stays so, then what is indefinite; a number changes nothing about an infinity.
MediaTime combinedBeyondNumbers(const MediaTime& a, const MediaTime& b, int sign)
{
    using Kind = MediaTime::Kind;
    for (const Kind kind : {Kind::Invalid, Kind::Indefinite})
        if (a.kind == kind || b.kind == kind)
            return {0, 0, kind};
    const Kind opposite = b.kind == Kind::PositiveInfinity ? Kind::NegativeInfinity : Kind::PositiveInfinity;
    const Kind second = b.isNumeric() || sign > 0 ? b.kind : opposite;
    if (a.isNumeric())
        return {0, 0, second};
    return b.isNumeric() || a.kind == second ? a : MediaTime::invalid();
}

MediaTime combined(const MediaTime& a, const MediaTime& b, int sign)
{
    if (!a.isNumeric() || !b.isNumeric())
        return combinedBeyondNumbers(a, b, sign);
    const std::int64_t common = std::lcm<std::int64_t>(a.timescale, b.timescale);
    if (common <= std::numeric_limits<std::int32_t>::max()) {
        const MediaTime exact =
            fromWide(Wide(a.value) * (common / a.timescale) + sign * Wide(b.value) * (common / b.timescale),
                     static_cast<std::int32_t>(common));
        if (exact.isValid())
            return exact;
    }
    return fromWide(Wide(a.value) + sign * rounded(Wide(b.value) * a.timescale, b.timescale), a.timescale);
}

double approximate(const MediaTime& time)
{
    if (time.kind == MediaTime::Kind::PositiveInfinity)
        return std::numeric_limits<double>::infinity();
    if (time.kind == MediaTime::Kind::NegativeInfinity)
        return -std::numeric_limits<double>::infinity();
    if (!time.isNumeric())
        return std::numeric_limits<double>::quiet_NaN();
    return static_cast<double>(time.value) / time.timescale;
}

} // namespace

MediaTime MediaTime::make(std::int64_t value, std::int32_t timescale)
{
    return timescale > 0 ? MediaTime{value, timescale, Kind::Numeric} : invalid();
}

MediaTime MediaTime::fromSeconds(double seconds, std::int32_t timescale)
{
    if (std::isnan(seconds) || timescale <= 0)
        return invalid();
    const double ticks = seconds * timescale;
    if (std::abs(ticks) >= 9.2e18)
        return {0, 0, seconds > 0 ? Kind::PositiveInfinity : Kind::NegativeInfinity};
    return make(std::llround(ticks), timescale);
}

double MediaTime::seconds() const
{
    return approximate(*this);
}

MediaTime MediaTime::convertedTo(std::int32_t newTimescale) const
{
    if (!isNumeric() || timescale == newTimescale)
        return *this;
    if (newTimescale <= 0)
        return invalid();
    return fromWide(rounded(Wide(value) * newTimescale, timescale), newTimescale);
}

std::partial_ordering operator<=>(const MediaTime& a, const MediaTime& b)
{
    if (!a.isNumeric() || !b.isNumeric())
        return approximate(a) <=> approximate(b);
    const Wide left = Wide(a.value) * b.timescale;
    const Wide right = Wide(b.value) * a.timescale;
    if (left == right)
        return std::partial_ordering::equivalent;
    return left < right ? std::partial_ordering::less : std::partial_ordering::greater;
}

MediaTime operator+(const MediaTime& a, const MediaTime& b)
{
    return combined(a, b, 1);
}

MediaTime operator-(const MediaTime& a, const MediaTime& b)
{
    return combined(a, b, -1);
}

} // namespace base

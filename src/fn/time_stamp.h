#pragma once

#include "fn/serialize.h"

#include <chrono>
#include <compare>
#include <string>

namespace Fn {

/// A moment in time, to the microsecond.
///
/// Packs as a 64-bit integer, the microseconds since 1970-01-01 00:00 UTC.
class TimeStamp {
public:
    using Duration = std::chrono::microseconds;

    /// The start of the epoch.
    TimeStamp() = default;
    explicit TimeStamp(Duration sinceEpoch) : sinceEpoch_(sinceEpoch) {}
    explicit TimeStamp(const Package& package) : sinceEpoch_(package.toInt64()) {}
    explicit operator Package() const { return Package(static_cast<long>(sinceEpoch_.count())); }

    static TimeStamp now();

    /// Reads asString()'s form; the fraction may have 1 to 6 digits or be left out with its point.
    /// @throws FNEBadFormat
    static TimeStamp fromString(const std::string& text);
    /// Universal time: "2024-05-31T23:59:59.123456Z".
    std::string asString() const;
    /// Local date, one blank, local time of day: "2024-05-31 23:59:59".
    std::string localAsString() const;

    Duration sinceEpoch() const noexcept { return sinceEpoch_; }

    friend TimeStamp operator+(TimeStamp t, Duration d) { return TimeStamp(t.sinceEpoch_ + d); }
    friend TimeStamp operator-(TimeStamp t, Duration d) { return TimeStamp(t.sinceEpoch_ - d); }
    friend Duration operator-(TimeStamp a, TimeStamp b) { return a.sinceEpoch_ - b.sinceEpoch_; }
    friend auto operator<=>(const TimeStamp&, const TimeStamp&) = default;

private:
    Duration sinceEpoch_{0};
};

} // namespace Fn

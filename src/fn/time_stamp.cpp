#include "fn/time_stamp.h"

#include <cstdio>
#include <ctime>

namespace Fn {

namespace {

using std::chrono::days;
using std::chrono::seconds;

/// The number of `digits` decimal digits at `pos`, which is moved behind them.
int takeNumber(const std::string& text, std::size_t& pos, int digits) {
    int number = 0;
    for (int i = 0; i < digits; ++i, ++pos) {
        if (pos >= text.size() || text[pos] < '0' || text[pos] > '9')
            FN_THROW(FNEBadFormat,
                     "TimeStamp: no digit at position " + std::to_string(pos) + " of '" + text + "'");
        number = number * 10 + (text[pos] - '0');
    }
    return number;
}

void takeSeparator(const std::string& text, std::size_t& pos, char separator) {
    if (pos >= text.size() || text[pos] != separator)
        FN_THROW(FNEBadFormat, "TimeStamp: no '" + std::string(1, separator) + "' at position " +
                                   std::to_string(pos) + " of '" + text + "'");
    ++pos;
}

/// Microseconds from the digits behind the decimal point.
int takeFraction(const std::string& text, std::size_t& pos) {
    if (pos >= text.size() || text[pos] != '.') return 0;
    ++pos;
    int fraction = takeNumber(text, pos, 1), digits = 1;
    for (; digits < 6 && pos < text.size() && text[pos] >= '0' && text[pos] <= '9'; ++digits)
        fraction = fraction * 10 + takeNumber(text, pos, 1);
    for (; digits < 6; ++digits) fraction *= 10;
    return fraction;
}

} // namespace

TimeStamp TimeStamp::now() {
    return TimeStamp(
        std::chrono::duration_cast<Duration>(std::chrono::system_clock::now().time_since_epoch()));
}

TimeStamp TimeStamp::fromString(const std::string& text) {
    std::size_t pos = 0;
    const auto field = [&](int digits, char separator) {
        const int number = takeNumber(text, pos, digits);
        if (separator) takeSeparator(text, pos, separator);
        return number;
    };
    const std::chrono::year year(field(4, '-'));
    const std::chrono::month month(static_cast<unsigned>(field(2, '-')));
    const std::chrono::day day(static_cast<unsigned>(field(2, 'T')));
    const int hour = field(2, ':'), minute = field(2, ':'), second = field(2, 0);
    const int fraction = takeFraction(text, pos);
    takeSeparator(text, pos, 'Z');
    const std::chrono::year_month_day date(year, month, day);
    if (pos != text.size() || !date.ok() || hour > 23 || minute > 59 || second > 60)
        FN_THROW(FNEBadFormat, "TimeStamp: '" + text + "' is not a point in time");
    return TimeStamp(std::chrono::sys_days(date).time_since_epoch() + std::chrono::hours(hour) +
                     std::chrono::minutes(minute) + seconds(second) + Duration(fraction));
}

std::string TimeStamp::asString() const {
    const auto day = std::chrono::floor<days>(sinceEpoch_);
    const std::chrono::year_month_day date{std::chrono::sys_days(day)};
    const std::chrono::hh_mm_ss time(sinceEpoch_ - day);
    char text[64];
    std::snprintf(text, sizeof text, "%04d-%02u-%02uT%02d:%02d:%02d.%06dZ", static_cast<int>(date.year()),
                  static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()),
                  static_cast<int>(time.hours().count()), static_cast<int>(time.minutes().count()),
                  static_cast<int>(time.seconds().count()), static_cast<int>(time.subseconds().count()));
    return text;
}

std::string TimeStamp::localAsString() const {
    const std::time_t time = std::chrono::floor<seconds>(sinceEpoch_).count();
    std::tm local{};
    localtime_r(&time, &local);
    char text[64];
    std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &local);
    return text;
}

} // namespace Fn

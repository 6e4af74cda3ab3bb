#pragma once

// Dates, times and durations as XML Schema writes them, for properties of std::chrono types and for
// qx::DateTime, which keeps the offset that a text has:
//
//     std::chrono::year_month_day          2026-03-01
//     sys_days, local_days                 2026-03-01
//     sys_time<D>                          2026-03-01T09:30:00.25Z     read from any offset,
//     written in UTC;
//                                                                      a text without an offset is
//                                                                      UTC
//     local_time<D>                        2026-03-01T09:30:00         a text with an offset is
//     refused std::chrono::hh_mm_ss<D>             09:30:00.25 std::chrono::year_month, year
//     2026-03, 2026 duration<Rep, Period>                P1DT2H30M0.5S               years and
//     months are refused: their
//                                                                      length is unknown
//     qx::DateTime                         2026-03-01T09:30:00.25+02:00
//
// What a type cannot hold without loss is refused: a fraction of a second for sys_seconds, say.
// White space around a text is passed over. Years go from -32767 to 32767.

#include <QXXMLMarshalling/model/ValueTraits.h>

#include <chrono>
#include <ratio>

namespace qx {

// A date and a time of day at some place, with its offset from UTC if the text had one.
struct QX_API DateTime {
    std::chrono::local_seconds local{};           // what the clock there shows
    std::chrono::nanoseconds fraction{};          // of a second, from 0 to below 1 s
    std::optional<std::chrono::minutes> offset{}; // of the local time, east is positive
    bool isZulu = false;                          // an offset of 0 is written "Z", not "+00:00"

    // None where the text is no date and time, or one that a DateTime cannot hold: more than nine
    // digits of a second's fraction, unless they are zeros.
    static std::optional<DateTime> parse(std::string_view text);
    // "2026-03-01T09:30:00.25+02:00".
    String text() const;
    // The moment in UTC; a time without an offset counts as UTC.
    std::chrono::sys_seconds seconds() const {
        return std::chrono::sys_seconds(
            (local - offset.value_or(std::chrono::minutes(0))).time_since_epoch());
    }

    friend bool operator==(const DateTime&, const DateTime&) = default;
};

namespace detail {

// A span of time, or the time since the epoch: both parts have the same sign.
struct Seconds {
    std::int64_t whole = 0;
    std::int64_t nanoseconds = 0;
};

QX_API bool readDuration(const Value& value, Seconds& result);
QX_API String durationText(Seconds duration);
QX_API bool readDateTime(const Value& value, DateTime& result);
QX_API bool readDate(const Value& value, std::chrono::year_month_day& result);
QX_API String dateText(std::chrono::year_month_day date);
QX_API bool readTimeOfDay(const Value& value, Seconds& result);
QX_API String timeOfDayText(Seconds time);
QX_API bool readYearMonth(const Value& value, std::chrono::year_month& result);
QX_API String yearMonthText(std::chrono::year_month month);
QX_API bool readYear(const Value& value, std::chrono::year& result);
QX_API String yearText(std::chrono::year year);

constexpr std::int64_t nanosecondsOfSecond = 1'000'000'000;

template <class Rep, class Period>
Seconds secondsOf(std::chrono::duration<Rep, Period> duration) {
    if constexpr (std::floating_point<Rep>) {
        const double seconds = std::chrono::duration<double>(duration).count();
        const auto whole = static_cast<std::int64_t>(seconds);
        const double rest = seconds - static_cast<double>(whole);
        return {whole, static_cast<std::int64_t>(rest * nanosecondsOfSecond)};
    } else {
        const auto whole = std::chrono::duration_cast<std::chrono::seconds>(duration);
        const auto rest = std::chrono::duration_cast<std::chrono::nanoseconds>(duration - whole);
        return {whole.count(), rest.count()};
    }
}

// False where the type would lose something of the span.
template <class Rep, class Period>
bool assign(std::chrono::duration<Rep, Period>& duration, Seconds seconds) {
    if constexpr (std::floating_point<Rep>) {
        duration = std::chrono::duration<double>(static_cast<double>(seconds.whole) +
                                                 static_cast<double>(seconds.nanoseconds) /
                                                     nanosecondsOfSecond);
        return true;
    } else if constexpr (Period::den == 1) {
        if (seconds.nanoseconds != 0 || seconds.whole % Period::num != 0 ||
            !std::in_range<Rep>(seconds.whole / Period::num))
            return false;
        duration =
            std::chrono::duration<Rep, Period>(static_cast<Rep>(seconds.whole / Period::num));
        return true;
    } else {
        static_assert(Period::num == 1 && nanosecondsOfSecond % Period::den == 0,
                      "a duration's unit is some seconds, or a decimal fraction of one");
        constexpr std::int64_t unit = nanosecondsOfSecond / Period::den;
        std::int64_t count = 0;
        if (seconds.nanoseconds % unit != 0 ||
            __builtin_mul_overflow(seconds.whole, std::int64_t{Period::den}, &count) ||
            __builtin_add_overflow(count, seconds.nanoseconds / unit, &count) ||
            !std::in_range<Rep>(count))
            return false;
        duration = std::chrono::duration<Rep, Period>(static_cast<Rep>(count));
        return true;
    }
}

// Both clocks count from the same midnight.
template <class Clock, class Duration>
DateTime dateTimeOf(std::chrono::time_point<Clock, Duration> time) {
    const auto whole = std::chrono::floor<std::chrono::seconds>(time);
    const auto rest = std::chrono::duration_cast<std::chrono::nanoseconds>(time - whole);
    return {std::chrono::local_seconds(whole.time_since_epoch()), rest, std::nullopt, false};
}

template <class Clock, class Duration>
bool assign(std::chrono::time_point<Clock, Duration>& time, std::chrono::seconds sinceEpoch,
            std::chrono::nanoseconds fraction) {
    Seconds seconds{sinceEpoch.count(), fraction.count()};
    if (seconds.whole < 0 && seconds.nanoseconds > 0) {
        ++seconds.whole;
        seconds.nanoseconds -= nanosecondsOfSecond;
    }
    Duration read{};
    if (!assign(read, seconds))
        return false;
    time = std::chrono::time_point<Clock, Duration>(read);
    return true;
}

} // namespace detail

template <>
struct ValueTraits<DateTime> {
    static Value toValue(const DateTime& time) { return time.text(); }
    static bool fromValue(const Value& value, DateTime& result) {
        return detail::readDateTime(value, result);
    }
};

template <class Duration>
requires(!std::same_as<Duration,
                       std::chrono::days>) struct ValueTraits<std::chrono::sys_time<Duration>> {
    using Time = std::chrono::sys_time<Duration>;
    static Value toValue(Time value) {
        DateTime time = detail::dateTimeOf(value);
        time.offset = std::chrono::minutes(0);
        time.isZulu = true;
        return time.text();
    }
    static bool fromValue(const Value& value, Time& result) {
        DateTime time;
        return detail::readDateTime(value, time) &&
               detail::assign(result, time.seconds().time_since_epoch(), time.fraction);
    }
};

template <class Duration>
requires(!std::same_as<Duration,
                       std::chrono::days>) struct ValueTraits<std::chrono::local_time<Duration>> {
    using Time = std::chrono::local_time<Duration>;
    static Value toValue(Time value) { return detail::dateTimeOf(value).text(); }
    static bool fromValue(const Value& value, Time& result) {
        DateTime time;
        return detail::readDateTime(value, time) && !time.offset &&
               detail::assign(result, time.local.time_since_epoch(), time.fraction);
    }
};

template <>
struct ValueTraits<std::chrono::year_month_day> {
    static Value toValue(std::chrono::year_month_day date) { return detail::dateText(date); }
    static bool fromValue(const Value& value, std::chrono::year_month_day& result) {
        return detail::readDate(value, result);
    }
};

// Days are dates, of either clock.
template <class Clock>
requires std::same_as<Clock, std::chrono::system_clock> || std::same_as<Clock, std::chrono::local_t>
struct ValueTraits<std::chrono::time_point<Clock, std::chrono::days>> {
    using Days = std::chrono::time_point<Clock, std::chrono::days>;
    static Value toValue(Days days) {
        return detail::dateText(std::chrono::sys_days(days.time_since_epoch()));
    }
    static bool fromValue(const Value& value, Days& result) {
        std::chrono::year_month_day date;
        if (!detail::readDate(value, date))
            return false;
        result = Days(std::chrono::sys_days(date).time_since_epoch());
        return true;
    }
};

template <class Duration>
struct ValueTraits<std::chrono::hh_mm_ss<Duration>> {
    using Time = std::chrono::hh_mm_ss<Duration>;
    static Value toValue(const Time& time) {
        return detail::timeOfDayText(detail::secondsOf(time.to_duration()));
    }
    static bool fromValue(const Value& value, Time& result) {
        detail::Seconds seconds;
        typename Time::precision read{};
        if (!detail::readTimeOfDay(value, seconds) || !detail::assign(read, seconds))
            return false;
        result = Time(std::chrono::duration_cast<Duration>(read));
        return true;
    }
};

template <class Rep, class Period>
struct ValueTraits<std::chrono::duration<Rep, Period>> {
    using Duration = std::chrono::duration<Rep, Period>;
    static Value toValue(Duration duration) {
        return detail::durationText(detail::secondsOf(duration));
    }
    static bool fromValue(const Value& value, Duration& result) {
        detail::Seconds seconds;
        return detail::readDuration(value, seconds) && detail::assign(result, seconds);
    }
};

template <>
struct ValueTraits<std::chrono::year_month> {
    static Value toValue(std::chrono::year_month month) { return detail::yearMonthText(month); }
    static bool fromValue(const Value& value, std::chrono::year_month& result) {
        return detail::readYearMonth(value, result);
    }
};

template <>
struct ValueTraits<std::chrono::year> {
    static Value toValue(std::chrono::year year) { return detail::yearText(year); }
    static bool fromValue(const Value& value, std::chrono::year& result) {
        return detail::readYear(value, result);
    }
};

} // namespace qx

#include <QXXMLMarshalling/model/DateTime.h>

#include "base/WhiteSpace.h"

#include <algorithm>
#include <array>
#include <cstdlib>

namespace qx {

namespace {

namespace chrono = std::chrono;
using detail::Seconds;

constexpr std::int64_t secondsOfMinute = 60;
constexpr std::int64_t secondsOfHour = 3'600;
constexpr std::int64_t secondsOfDay = 86'400;
constexpr std::size_t digitsOfNanosecond = 9;

bool isDigit(char c) { return c >= '0' && c <= '9'; }

// Reads a text from its start. What is not there leaves it where it is.
class Cursor {
public:
    explicit Cursor(std::string_view text) : _rest(trimmed(text)) {}

    bool isAtEnd() const { return _rest.empty(); }
    bool take(char c) {
        if (_rest.empty() || _rest.front() != c)
            return false;
        _rest.remove_prefix(1);
        return true;
    }
    // All digits that stand here; none where there is not one.
    std::string_view takeDigits() {
        std::size_t count = 0;
        while (count < _rest.size() && isDigit(_rest[count]))
            ++count;
        const std::string_view digits = _rest.substr(0, count);
        _rest.remove_prefix(count);
        return digits;
    }
    // A number of exactly two digits.
    bool takeTwo(std::int64_t& number) {
        if (_rest.size() < 2 || !isDigit(_rest[0]) || !isDigit(_rest[1]))
            return false;
        number = (_rest[0] - '0') * 10 + (_rest[1] - '0');
        _rest.remove_prefix(2);
        return true;
    }

private:
    std::string_view _rest;
};

bool numberOf(std::string_view digits, std::int64_t& number) {
    number = 0;
    for (const char c : digits)
        if (__builtin_mul_overflow(number, std::int64_t{10}, &number) ||
            __builtin_add_overflow(number, std::int64_t{c - '0'}, &number))
            return false;
    return !digits.empty();
}

// The digits behind a decimal point, as nanoseconds; finer ones may only be zeros.
bool nanosecondsOf(std::string_view digits, std::int64_t& nanoseconds) {
    const std::string_view finer = digits.substr(std::min(digits.size(), digitsOfNanosecond));
    if (digits.empty() || finer.find_first_not_of('0') != std::string_view::npos)
        return false;
    std::string whole(digits.substr(0, digitsOfNanosecond));
    whole.resize(digitsOfNanosecond, '0');
    return numberOf(whole, nanoseconds);
}

// At least four digits, no needless zeros before them.
bool takeYear(Cursor& cursor, chrono::year& year) {
    const bool isNegative = cursor.take('-');
    const std::string_view digits = cursor.takeDigits();
    std::int64_t number = 0;
    if (digits.size() < 4 || (digits.size() > 4 && digits.front() == '0') ||
        !numberOf(digits, number) || number > static_cast<int>(chrono::year::max()))
        return false;
    year = chrono::year(static_cast<int>(isNegative ? -number : number));
    return true;
}

bool takeYearMonth(Cursor& cursor, chrono::year_month& result) {
    chrono::year year{};
    std::int64_t month = 0;
    if (!takeYear(cursor, year) || !cursor.take('-') || !cursor.takeTwo(month))
        return false;
    result = year / chrono::month(static_cast<unsigned>(month));
    return result.ok();
}

bool takeDate(Cursor& cursor, chrono::year_month_day& result) {
    chrono::year_month month{};
    std::int64_t day = 0;
    if (!takeYearMonth(cursor, month) || !cursor.take('-') || !cursor.takeTwo(day))
        return false;
    result = month / chrono::day(static_cast<unsigned>(day));
    return result.ok();
}

// "hh:mm:ss", with a fraction; "24:00:00" ends the day.
bool takeTime(Cursor& cursor, Seconds& result) {
    std::int64_t hours = 0;
    std::int64_t minutes = 0;
    std::int64_t seconds = 0;
    if (!cursor.takeTwo(hours) || !cursor.take(':') || !cursor.takeTwo(minutes) ||
        !cursor.take(':') || !cursor.takeTwo(seconds) || minutes > 59 || seconds > 59)
        return false;
    result = {hours * secondsOfHour + minutes * secondsOfMinute + seconds, 0};
    if (cursor.take('.') && !nanosecondsOf(cursor.takeDigits(), result.nanoseconds))
        return false;
    return result.whole < secondsOfDay || (result.whole == secondsOfDay && result.nanoseconds == 0);
}

// "Z", "+hh:mm", "-hh:mm", or nothing; at most fourteen hours.
bool takeOffset(Cursor& cursor, DateTime& time) {
    time.isZulu = cursor.take('Z');
    const bool isWest = cursor.take('-');
    if (time.isZulu || (!isWest && !cursor.take('+'))) {
        if (time.isZulu)
            time.offset = chrono::minutes(0);
        return !isWest;
    }
    constexpr std::int64_t farthest = 14 * 60;
    std::int64_t hours = 0;
    std::int64_t minutes = 0;
    if (!cursor.takeTwo(hours) || !cursor.take(':') || !cursor.takeTwo(minutes) || minutes > 59 ||
        hours * 60 + minutes > farthest)
        return false;
    time.offset = chrono::minutes((isWest ? -1 : 1) * (hours * 60 + minutes));
    return true;
}

// A number in front of its unit, as seconds on top of what is there; nothing where none stands.
// Units come in the order of `units`, each at most once.
struct Unit {
    char letter;
    std::int64_t seconds; // 0: of no fixed length
};

bool takeUnits(Cursor& cursor, std::span<const Unit> units, Seconds& result, bool& isAny) {
    while (!units.empty()) {
        const std::string_view digits = cursor.takeDigits();
        if (digits.empty())
            return true;
        std::int64_t number = 0;
        if (!numberOf(digits, number))
            return false;
        const bool isDecimal = cursor.take('.');
        if (isDecimal && !nanosecondsOf(cursor.takeDigits(), result.nanoseconds))
            return false;
        while (!units.empty() && !cursor.take(units.front().letter))
            units = units.subspan(1);
        if (units.empty() || (isDecimal && units.front().letter != 'S') ||
            (units.front().seconds == 0 && number != 0) ||
            __builtin_mul_overflow(number, units.front().seconds, &number) ||
            __builtin_add_overflow(result.whole, number, &result.whole))
            return false;
        units = units.subspan(1);
        isAny = true;
    }
    return true;
}

// With zeros before it, up to that many digits.
std::string padded(std::int64_t number, std::size_t digits) {
    const std::string text = std::to_string(number);
    return std::string(digits - std::min(digits, text.size()), '0') + text;
}

std::string fractionText(std::int64_t nanoseconds) {
    if (nanoseconds == 0)
        return {};
    const std::string text = padded(nanoseconds, digitsOfNanosecond);
    return "." + text.substr(0, text.find_last_not_of('0') + 1);
}

std::string textOf(chrono::year year) {
    const int number = static_cast<int>(year);
    return (number < 0 ? "-" : "") + padded(number < 0 ? -number : number, 4);
}

std::string textOf(chrono::year_month month) {
    return textOf(month.year()) + "-" + padded(static_cast<unsigned>(month.month()), 2);
}

std::string textOf(chrono::year_month_day date) {
    return textOf(date.year() / date.month()) + "-" + padded(static_cast<unsigned>(date.day()), 2);
}

std::string timeText(Seconds time) {
    return padded(time.whole / secondsOfHour, 2) + ":" +
           padded(time.whole / secondsOfMinute % 60, 2) + ":" + padded(time.whole % 60, 2) +
           fractionText(time.nanoseconds);
}

// Runs `take` over the whole of a value's text.
template <class Take>
bool readWhole(const Value& value, Take take) {
    if (!value.isString())
        return false;
    const String text = value.string();
    Cursor cursor(text);
    return take(cursor) && cursor.isAtEnd();
}

} // namespace

std::optional<DateTime> DateTime::parse(std::string_view text) {
    Cursor cursor(text);
    DateTime time;
    chrono::year_month_day date{};
    Seconds clock;
    if (!takeDate(cursor, date) || !cursor.take('T') || !takeTime(cursor, clock) ||
        !takeOffset(cursor, time) || !cursor.isAtEnd())
        return std::nullopt;
    time.local = chrono::local_seconds(chrono::local_days(date)) + chrono::seconds(clock.whole);
    time.fraction = chrono::nanoseconds(clock.nanoseconds);
    return time;
}

String DateTime::text() const {
    const auto day = chrono::floor<chrono::days>(local);
    std::string text = textOf(chrono::year_month_day(day)) + "T" +
                       timeText({(local - day).count(), fraction.count()});
    if (!offset)
        return text;
    if (isZulu && offset->count() == 0)
        return text + "Z";
    const std::int64_t minutes = std::abs(static_cast<std::int64_t>(offset->count()));
    return text + (offset->count() < 0 ? "-" : "+") + padded(minutes / 60, 2) + ":" +
           padded(minutes % 60, 2);
}

namespace detail {

bool readDateTime(const Value& value, DateTime& result) {
    if (!value.isString())
        return false;
    const auto read = DateTime::parse(value.string());
    if (read)
        result = *read;
    return read.has_value();
}

bool readDate(const Value& value, chrono::year_month_day& result) {
    chrono::year_month_day read{};
    if (!readWhole(value, [&](Cursor& cursor) { return takeDate(cursor, read); }))
        return false;
    result = read;
    return true;
}

bool readTimeOfDay(const Value& value, Seconds& result) {
    return readWhole(value, [&](Cursor& cursor) { return takeTime(cursor, result); });
}

bool readYearMonth(const Value& value, chrono::year_month& result) {
    chrono::year_month read{};
    if (!readWhole(value, [&](Cursor& cursor) { return takeYearMonth(cursor, read); }))
        return false;
    result = read;
    return true;
}

bool readYear(const Value& value, chrono::year& result) {
    chrono::year read{};
    if (!readWhole(value, [&](Cursor& cursor) { return takeYear(cursor, read); }))
        return false;
    result = read;
    return true;
}

// "P1Y2M3DT4H5M6.7S", with a sign before it; every part may be missing, but not all of them.
bool readDuration(const Value& value, Seconds& result) {
    static constexpr std::array dateUnits{Unit{'Y', 0}, Unit{'M', 0}, Unit{'D', secondsOfDay}};
    static constexpr std::array timeUnits{Unit{'H', secondsOfHour}, Unit{'M', secondsOfMinute},
                                          Unit{'S', 1}};
    Seconds read;
    const bool isDuration = readWhole(value, [&](Cursor& cursor) {
        const bool isNegative = cursor.take('-');
        bool hasDays = false;
        bool hasTime = false;
        if (!cursor.take('P') || !takeUnits(cursor, dateUnits, read, hasDays))
            return false;
        const bool mustHaveTime = cursor.take('T');
        if (mustHaveTime && !takeUnits(cursor, timeUnits, read, hasTime))
            return false;
        if (isNegative)
            read = {-read.whole, -read.nanoseconds};
        return mustHaveTime ? hasTime : hasDays;
    });
    if (isDuration)
        result = read;
    return isDuration;
}

String durationText(Seconds duration) {
    const bool isNegative = duration.whole < 0 || duration.nanoseconds < 0;
    // The most negative number has no counterpart.
    std::uint64_t rest = isNegative ? 0 - static_cast<std::uint64_t>(duration.whole)
                                    : static_cast<std::uint64_t>(duration.whole);
    const std::int64_t nanoseconds = isNegative ? -duration.nanoseconds : duration.nanoseconds;
    std::string text = isNegative ? "-P" : "P";
    const auto add = [&](std::int64_t unit, char letter) {
        const std::uint64_t count = rest / static_cast<std::uint64_t>(unit);
        rest %= static_cast<std::uint64_t>(unit);
        if (count != 0)
            text += std::to_string(count) + letter;
    };
    add(secondsOfDay, 'D');
    if (rest == 0 && nanoseconds == 0)
        return text.back() == 'P' ? String("PT0S") : String(text);
    text += 'T';
    add(secondsOfHour, 'H');
    add(secondsOfMinute, 'M');
    if (rest != 0 || nanoseconds != 0)
        text += std::to_string(rest) + fractionText(nanoseconds) + 'S';
    return text;
}

String dateText(chrono::year_month_day date) { return textOf(date); }
String timeOfDayText(Seconds time) { return timeText(time); }
String yearMonthText(chrono::year_month month) { return textOf(month); }
String yearText(chrono::year year) { return textOf(year); }

} // namespace detail

} // namespace qx

// Dates, times and durations as texts.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/DateTime.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;
namespace chrono = std::chrono;

class Times : public Object {
public:
    DateTime dateTime;
    chrono::sys_seconds second{};
    chrono::sys_time<chrono::nanoseconds> nano{};
    chrono::local_time<chrono::milliseconds> local{};
    chrono::sys_days day{};
    chrono::year_month_day date{};
    chrono::hh_mm_ss<chrono::milliseconds> time{};
    chrono::seconds seconds{};
    chrono::hours hours{};
    chrono::duration<double> real{};
    chrono::duration<std::int8_t, std::milli> small{};
    chrono::year_month month{};
    chrono::year year{};
};

const bool described = [] {
    Class::define<Times>("DateTimeTest.Times")
        .property<&Times::dateTime>("dateTime")
        .property<&Times::second>("second")
        .property<&Times::nano>("nano")
        .property<&Times::local>("local")
        .property<&Times::day>("day")
        .property<&Times::date>("date")
        .property<&Times::time>("time")
        .property<&Times::seconds>("seconds")
        .property<&Times::hours>("hours")
        .property<&Times::real>("real")
        .property<&Times::small>("small")
        .property<&Times::month>("month")
        .property<&Times::year>("year");
    return true;
}();

struct Case {
    const char* text;
    const char* written; // null: refused
};

constexpr const char* same = "";
constexpr const char* refused = nullptr;

TEST(DateTimeTest, TextsAreReadAndWrittenOrRefusedWhole) {
    const struct {
        const char* key;
        std::vector<Case> cases;
    } kinds[] = {
        {"dateTime",
         {{"2026-03-01T09:30:00+02:00", same},
          {"2026-03-01T09:30:00.250Z", "2026-03-01T09:30:00.25Z"},
          {"2026-03-01T09:30:00", same},
          {" 2026-03-01T09:30:00-00:00\n", "2026-03-01T09:30:00+00:00"},
          {"2026-03-01T24:00:00-14:00", "2026-03-02T00:00:00-14:00"},
          {"-0044-03-15T12:00:00.123456789Z", same},
          {"12026-03-01T00:00:00.1234567890Z", "12026-03-01T00:00:00.123456789Z"},
          {"2026-03-01T00:00:00.1234567891Z", refused},
          {"2026-02-29T00:00:00Z", refused},
          {"2026-03-01T24:00:01Z", refused},
          {"2026-03-01T00:60:00Z", refused},
          {"2026-03-01T00:00:60Z", refused},
          {"2026-03-01T00:00:00+14:01", refused},
          {"2026-03-01T00:00:00.Z", refused},
          {"2026-03-01 00:00:00", refused},
          {"2026-3-1T00:00:00", refused},
          {"02026-03-01T00:00:00", refused},
          {"99999999999999999999-03-01T00:00:00", refused},
          {"2026-03-01T00:00:00Z+", refused},
          {"", refused}}},
        {"second",
         {{"2026-03-01T00:30:00+02:00", "2026-02-28T22:30:00Z"},
          {"1969-12-31T23:59:59", "1969-12-31T23:59:59Z"},
          {"0001-01-01T00:00:00Z", same},
          {"2026-03-01T00:30:00.5Z", refused}}},
        {"nano",
         {{"1969-12-31T23:59:59.999999999Z", same},
          {"1700-01-01T00:00:00.5Z", same},
          {"0001-01-01T00:00:00Z", refused}}},
        {"local", {{"2026-03-01T00:30:00.125", same}, {"2026-03-01T00:30:00Z", refused}}},
        {"day", {{"1969-12-31", same}, {"1969-12-31T00:00:00Z", refused}}},
        {"date", {{"2024-02-29", same}, {"2026-13-01", refused}, {"2024-02-29Z", refused}}},
        {"time", {{"23:59:59.999", same}, {"09:30:00.0001", refused}, {"9:30:00", refused}}},
        {"seconds",
         {{"P1DT2H30M", same},
          {"PT90M", "PT1H30M"},
          {"-P1D", same},
          {"P0Y0M1D", "P1D"},
          {"PT0S", same},
          {"P1Y", refused},
          {"PT", refused},
          {"P", refused},
          {"P1DT", refused},
          {"PT1M1H", refused},
          {"PT1.5M", refused},
          {"PT1.5S", refused},
          {"PT1", refused},
          {"P106751991167301D", refused}}},
        {"hours", {{"P1DT1H", same}, {"PT90M", refused}}},
        {"real", {{"-PT1.5S", same}, {"PT0.25S", same}}},
        {"small", {{"-PT0.128S", same}, {"PT0.128S", refused}}},
        {"month", {{"2026-03", same}, {"2026-00", refused}}},
        {"year", {{"-0001", same}, {"26", refused}, {"40000", refused}}},
    };
    for (const auto& [key, cases] : kinds) {
        for (const auto& [text, written] : cases) {
            const auto times = make<Times>();
            const Value before = times->valueForKey(key);
            const bool taken = times->trySetValueForKey(text, key) == SetOutcome::set;
            EXPECT_EQ(taken, written != refused) << key << " " << text;
            const Value expected = !taken ? before : Value(*written != '\0' ? written : text);
            EXPECT_EQ(times->valueForKey(key), expected) << key << " " << text;
        }
    }
}

TEST(DateTimeTest, AMomentIsTheSameWhateverTheOffset) {
    EXPECT_EQ(DateTime::parse("2026-03-01T00:30:00+02:00")->seconds(),
              DateTime::parse("2026-02-28T22:30:00Z")->seconds());
}

} // namespace

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

TEST(DateTimeTest, TextsAreReadAndWrittenOrRefusedWhole) {
    const struct {
        const char* key;
        std::vector<const char*> same;
        std::vector<std::pair<const char*, const char*>> written;
        std::vector<const char*> refused;
    } kinds[] = {
        {"dateTime",
         {"2026-03-01T09:30:00+02:00", "2026-03-01T09:30:00", "-0044-03-15T12:00:00.123456789Z"},
         {{"2026-03-01T09:30:00.250Z", "2026-03-01T09:30:00.25Z"},
          {" 2026-03-01T09:30:00-00:00\n", "2026-03-01T09:30:00+00:00"},
          {"2026-03-01T24:00:00-14:00", "2026-03-02T00:00:00-14:00"},
          {"12026-03-01T00:00:00.1234567890Z", "12026-03-01T00:00:00.123456789Z"}},
         {"2026-03-01T00:00:00.1234567891Z", "2026-02-29T00:00:00Z", "2026-03-01T24:00:01Z",
          "2026-03-01T00:60:00Z", "2026-03-01T00:00:60Z", "2026-03-01T00:00:00+14:01",
          "2026-03-01T00:00:00.Z", "2026-03-01 00:00:00", "2026-3-1T00:00:00",
          "02026-03-01T00:00:00", "99999999999999999999-03-01T00:00:00", "2026-03-01T00:00:00Z+",
          ""}},
        {"second",
         {"0001-01-01T00:00:00Z"},
         {{"2026-03-01T00:30:00+02:00", "2026-02-28T22:30:00Z"},
          {"1969-12-31T23:59:59", "1969-12-31T23:59:59Z"}},
         {"2026-03-01T00:30:00.5Z"}},
        {"nano",
         {"1969-12-31T23:59:59.999999999Z", "1700-01-01T00:00:00.5Z"},
         {},
         {"0001-01-01T00:00:00Z"}},
        {"local", {"2026-03-01T00:30:00.125"}, {}, {"2026-03-01T00:30:00Z"}},
        {"day", {"1969-12-31"}, {}, {"1969-12-31T00:00:00Z"}},
        {"date", {"2024-02-29"}, {}, {"2026-13-01", "2024-02-29Z"}},
        {"time", {"23:59:59.999"}, {}, {"09:30:00.0001", "9:30:00"}},
        {"seconds",
         {"P1DT2H30M", "-P1D", "PT0S"},
         {{"PT90M", "PT1H30M"}, {"P0Y0M1D", "P1D"}},
         {"P1Y", "PT", "P", "P1DT", "PT1M1H", "PT1.5M", "PT1.5S", "PT1", "P106751991167301D"}},
        {"hours", {"P1DT1H"}, {}, {"PT90M"}},
        {"real", {"-PT1.5S", "PT0.25S"}, {}, {}},
        {"small", {"-PT0.128S"}, {}, {"PT0.128S"}},
        {"month", {"2026-03"}, {}, {"2026-00"}},
        {"year", {"-0001"}, {}, {"26", "40000"}}};
    for (const auto& [key, same, written, refused] : kinds) {
        const auto times = make<Times>();
        const auto expectTaken = [&, &name = key](const char* text, const char* expected) {
            EXPECT_EQ(times->trySetValueForKey(text, name), SetOutcome::set) << name << " " << text;
            EXPECT_EQ(times->valueForKey(name), Value(expected)) << name << " " << text;
        };
        for (const char* text : same)
            expectTaken(text, text);
        for (const auto& [text, expected] : written)
            expectTaken(text, expected);
        const Value before = times->valueForKey(key);
        for (const char* text : refused) {
            EXPECT_EQ(times->trySetValueForKey(text, key), SetOutcome::refused)
                << key << " " << text;
            EXPECT_EQ(times->valueForKey(key), before) << key << " " << text;
        }
    }
}

TEST(DateTimeTest, AMomentIsTheSameWhateverTheOffset) {
    EXPECT_EQ(DateTime::parse("2026-03-01T00:30:00+02:00")->seconds(),
              DateTime::parse("2026-02-28T22:30:00Z")->seconds());
}

} // namespace

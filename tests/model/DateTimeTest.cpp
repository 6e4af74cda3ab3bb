// Dates, times and durations as texts.

#include "support/Texts.h"

#include <QXXMLMarshalling/model/DateTime.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;
using namespace std::chrono;
using support::taken;

TEST(DateTimeTest, TextsAreReadAndWrittenOrRefusedWhole) {
    const struct {
        std::string (*taken)(const Value&);
        std::vector<const char*> same;
        std::vector<std::pair<const char*, const char*>> written;
        std::vector<const char*> refused;
    } kinds[] = {
        {taken<DateTime>,
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
        {taken<sys_seconds>,
         {"0001-01-01T00:00:00Z"},
         {{"2026-03-01T00:30:00+02:00", "2026-02-28T22:30:00Z"},
          {"1969-12-31T23:59:59", "1969-12-31T23:59:59Z"}},
         {"2026-03-01T00:30:00.5Z"}},
        {taken<sys_time<nanoseconds>>,
         {"1969-12-31T23:59:59.999999999Z", "1700-01-01T00:00:00.5Z"},
         {},
         {"0001-01-01T00:00:00Z"}},
        {taken<local_time<milliseconds>>,
         {"2026-03-01T00:30:00.125"},
         {},
         {"2026-03-01T00:30:00Z"}},
        {taken<sys_days>, {"1969-12-31"}, {}, {"1969-12-31T00:00:00Z"}},
        {taken<year_month_day>, {"2024-02-29"}, {}, {"2026-13-01", "2024-02-29Z"}},
        {taken<hh_mm_ss<milliseconds>>, {"23:59:59.999"}, {}, {"09:30:00.0001", "9:30:00"}},
        {taken<seconds>,
         {"P1DT2H30M", "-P1D", "PT0S"},
         {{"PT90M", "PT1H30M"}, {"P0Y0M1D", "P1D"}},
         {"P1Y", "PT", "P", "P1DT", "PT1M1H", "PT1.5M", "PT1.5S", "PT1", "P106751991167301D"}},
        {taken<hours>, {"P1DT1H"}, {}, {"PT90M"}},
        {taken<duration<double>>, {"-PT1.5S", "PT0.25S"}, {}, {}},
        {taken<duration<std::int8_t, std::milli>>, {"-PT0.128S"}, {}, {"PT0.128S"}},
        {taken<year_month>, {"2026-03"}, {}, {"2026-00"}},
        {taken<year>, {"-0001"}, {}, {"26", "40000"}}};
    for (const auto& [taken, same, written, refused] : kinds) {
        for (const char* text : same)
            EXPECT_EQ(taken(text), text);
        for (const auto& [text, expected] : written)
            EXPECT_EQ(taken(text), expected) << text;
        for (const char* text : refused)
            EXPECT_EQ(taken(text), "refused") << text;
    }
}

TEST(DateTimeTest, AMomentIsTheSameWhateverTheOffset) {
    EXPECT_EQ(DateTime::parse("2026-03-01T00:30:00+02:00")->seconds(),
              DateTime::parse("2026-02-28T22:30:00Z")->seconds());
}

} // namespace

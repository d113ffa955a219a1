#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>

#include "platform/linux/LinuxDateFormatter.h"

namespace accounts {
namespace {

using namespace std::chrono;

// The pattern in the names of migration-information files.
constexpr std::string_view kPattern = "Y-M-d-H-M-S";

class DateFormatterTest : public testing::Test {
 protected:
  DateFormatterTest() { useTimeZone("UTC0"); }
  ~DateFormatterTest() override { useTimeZone("UTC0"); }

  static void useTimeZone(const char* zone) {
    ::setenv("TZ", zone, 1);
    ::tzset();
  }

  // What a pattern gives at a day and a time of that day.
  static std::string format(std::string_view pattern, year_month_day day, nanoseconds time) {
    const auto moment = time_point_cast<system_clock::duration>(sys_days(day) + time);
    return LinuxDateFormatter([moment] { return moment; }).currentDate(pattern);
  }
};

TEST_F(DateFormatterTest, NoFieldOfOneLetterIsPadded) {
  EXPECT_EQ(format(kPattern, 2012y / March / 4, hours(5) + minutes(6) + seconds(7)),
            "2012-3-4-5-3-0");
}

TEST_F(DateFormatterTest, LongFieldsKeepTheirDigits) {
  EXPECT_EQ(format(kPattern, 2012y / December / 24, hours(23) + minutes(59) + milliseconds(987)),
            "2012-12-24-23-12-9");
}

TEST_F(DateFormatterTest, MidnightIsHourZero) {
  EXPECT_EQ(format("H", 2012y / March / 4, hours(0)), "0");
}

TEST_F(DateFormatterTest, TheYearIsThatOfTheWeekAtTheTurnOfTheYear) {
  EXPECT_EQ(format("Y-M-d", 2012y / January / 1, hours(0)), "2011-1-1");
  EXPECT_EQ(format("Y-M-d", 2012y / January / 2, hours(0)), "2012-1-2");
  EXPECT_EQ(format("Y-M-d", 2012y / December / 30, hours(0)), "2012-12-30");
  EXPECT_EQ(format("Y-M-d", 2012y / December / 31, hours(0)), "2013-12-31");
}

TEST_F(DateFormatterTest, TenthsOfASecondAreCutOff) {
  EXPECT_EQ(format("S", 2012y / March / 4, milliseconds(99)), "0");
  EXPECT_EQ(format("S", 2012y / March / 4, milliseconds(100)), "1");
  EXPECT_EQ(format("S", 2012y / March / 4, milliseconds(1999)), "9");
}

TEST_F(DateFormatterTest, TenthsBeforeTheEpochCountUpToTheNextSecond) {
  EXPECT_EQ(format("H-S", 1969y / December / 31, hours(23) + milliseconds(300)), "23-3");
}

TEST_F(DateFormatterTest, LongerRunsArePaddedAndLongerFractionsHaveMoreDigits) {
  EXPECT_EQ(format("MM/dd HH SSS", 2012y / March / 4, hours(5) + milliseconds(45)), "03/04 05 045");
}

TEST_F(DateFormatterTest, OtherCharactersStandForThemselves) {
  EXPECT_EQ(format("..H::", 2012y / March / 4, hours(5)), "..5::");
  EXPECT_EQ(format("", 2012y / March / 4, hours(5)), "");
}

TEST_F(DateFormatterTest, TheTimeIsThatOfTheLocalTimeZone) {
  useTimeZone("EST5");
  EXPECT_EQ(format("Y-M-d-H", 2012y / March / 4, hours(2)), "2012-3-3-21");
}

TEST_F(DateFormatterTest, WithoutAClockOfItsOwnItTellsTheSystemsYear) {
  const auto year = [] { return LinuxDateFormatter().currentDate("Y"); };
  const std::string before = format("Y", floor<days>(system_clock::now()), hours(0));
  const std::string now = year();
  const std::string after = format("Y", floor<days>(system_clock::now()), hours(0));
  EXPECT_TRUE(now == before || now == after) << now;
}

}  // namespace
}  // namespace accounts

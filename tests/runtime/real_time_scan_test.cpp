// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <random>
#include <string>

#include "runtime/file_time.h"
#include "tests/runtime/in_zone.h"
#include "tests/runtime/ticks.h"
#include "vexa/real_time.h"

namespace vexa {
namespace {

using test::InZone;
using test::ticks_in;

const CRealTime kBefore(2001, 2, 3, 4, 5, 6, 7, 0, true);

struct Scanned {
  int count;
  std::string time;  ///< what the value is afterwards
};

Scanned scan(const char* text, const char* format) {
  CRealTime time = kBefore;
  const int count = time.Scan(text, format, true);
  return {count, ticks_in(time) == 0 ? "unset" : time.Format("%Y-%O-%D %H:%M:%S.%03L", true)};
}

constexpr const char* kUnchanged = "2001-02-03 04:05:06.007";

TEST(RealTimeScan, EveryLetterReadsItsField) {
  const struct {
    const char* letter;
    const char* number;
    const char* time;
  } cases[] = {{"D", "09", "2024-01-09 00:00:00.000"},   {"d", "9", "2024-01-09 00:00:00.000"},
               {"O", "09", "2024-09-01 00:00:00.000"},   {"o", "9", "2024-09-01 00:00:00.000"},
               {"H", "09", "2024-01-01 09:00:00.000"},   {"h", "9", "2024-01-01 09:00:00.000"},
               {"M", "09", "2024-01-01 00:09:00.000"},   {"m", "9", "2024-01-01 00:09:00.000"},
               {"S", "09", "2024-01-01 00:00:09.000"},   {"s", "9", "2024-01-01 00:00:09.000"},
               {"L", "9", "2024-01-01 00:00:00.009"},    {"l", "9", "2024-01-01 00:00:00.090"},
               {"Y", "2019", "2019-01-01 00:00:00.000"}, {"y", "19", "2019-01-01 00:00:00.000"}};
  for (const auto& c : cases) {
    // A later directive for the same field wins.
    const Scanned result =
        scan((std::string("2024-1-1/") + c.number).c_str(), (std::string("%Y-%o-%d/%") + c.letter).c_str());
    EXPECT_EQ(result.count, 4) << c.letter;
    EXPECT_EQ(result.time, c.time) << c.letter;
  }
}

TEST(RealTimeScan, NumbersOutOfRangeGiveMinusOneAndLeaveTheValue) {
  const struct {
    const char* format;
    const char* first;
    const char* last;
    const char* below;
    const char* above;
  } cases[] = {{"%D", "1", "31", "0", "32"},      {"%d", "1", "31", "0", "32"},     {"%O", "1", "12", "0", "13"},
               {"%o", "1", "12", "0", "13"},      {"%H", "0", "23", "-1", "24"},    {"%h", "0", "23", "-1", "24"},
               {"%M", "0", "59", "-1", "60"},     {"%m", "0", "59", "-1", "60"},    {"%S", "0", "59", "-1", "60"},
               {"%s", "0", "59", "-1", "60"},     {"%L", "0", "999", "-1", "1000"}, {"%l", "0", "99", "-1", "-9"},
               {"%Y", "0", "9999", "-1", "-999"}, {"%y", "0", "99", "-1", "-9"}};
  for (const auto& c : cases) {
    EXPECT_EQ(scan(c.first, c.format).count, 1) << c.format;
    EXPECT_EQ(scan(c.last, c.format).count, 1) << c.format;
    for (const char* bad : {c.below, c.above}) {
      const Scanned result = scan(bad, c.format);
      EXPECT_EQ(result.count, -1) << c.format << " " << bad;
      EXPECT_EQ(result.time, kUnchanged) << c.format << " " << bad;
    }
  }
}

TEST(RealTimeScan, AnOutOfRangeNumberAfterGoodOnesLeavesTheValueToo) {
  const Scanned result = scan("2024-02-32", "%Y-%O-%D");
  EXPECT_EQ(result.count, -1);
  EXPECT_EQ(result.time, kUnchanged);
}

TEST(RealTimeScan, HugeNumbersAreOutOfRange) {
  for (const char* number : {"4294967297", "18446744073709551617", "99999999999999999999999999"}) {
    for (const char* format : {"%d", "%o", "%h", "%m", "%s", "%L"}) EXPECT_EQ(scan(number, format).count, -1) << number;
  }
}

TEST(RealTimeScan, UpperCaseLettersReadTwoCharactersAndTheYearFour) {
  EXPECT_EQ(scan("20245-0112-0912 2359:5999:5912.997", "%Y-%O-%D %H:%M:%S.%l").time, "2024-01-09 23:59:59.990");
}

TEST(RealTimeScan, LowerCaseLettersReadTheWholeNumber) {
  EXPECT_EQ(scan("2024-0000012-0000009 0000023:0000059:0000058", "%Y-%o-%d %h:%m:%s").time, "2024-12-09 23:59:58.000");
  EXPECT_EQ(scan("2024-1-009", "%Y-%o-%D").count, -1);  // "00"
  EXPECT_EQ(scan("2024-1-123", "%Y-%o-%d").count, -1);
}

TEST(RealTimeScan, TwoDigitYearsAreOfThisCentury) {
  EXPECT_EQ(scan("1-1-00", "%d-%o-%y").time, "2000-01-01 00:00:00.000");
  EXPECT_EQ(scan("1-1-37", "%d-%o-%y").time, "2037-01-01 00:00:00.000");
}

TEST(RealTimeScan, LiteralsAreSearchedForward) {
  EXPECT_EQ(scan("taken on 05-03-2026 at 09:07", "on %D-%O-%Y at %H:%M").time, "2026-03-05 09:07:00.000");
  EXPECT_EQ(scan("taken on 05-03-2026", "n %D").count, 0);  // the first n is in "taken", the space before "on"
  EXPECT_EQ(scan("a=1, year=2024, month=3, day=4", "=,=%Y=%o=%d").time, "2024-03-04 00:00:00.000");
}

TEST(RealTimeScan, ReadingANumberDoesNotMoveOn) {
  EXPECT_EQ(scan("2012", "%Y%O").count, -1);  // the month is read from the year's "20"
  EXPECT_EQ(scan("1112", "%O%D").count, 2);
  EXPECT_EQ(scan("1112-5", "%Y%O%D-%h").time, "unset");
  EXPECT_EQ(scan("07 2024", "%O%D%M%S %Y").time, "2024-07-07 00:07:07.000");
}

TEST(RealTimeScan, ACharacterThatIsNotInTheTextEndsReading) {
  EXPECT_EQ(scan("2024-03-04", "%Y/%O").count, 1);
  EXPECT_EQ(scan("2024-03-04", "/%Y").count, 0);
  EXPECT_EQ(scan("2024-03-04", "/%Y").time, kUnchanged);
  EXPECT_EQ(scan("2024-03-04", "%Y-%O-%D/////").count, 3);
}

TEST(RealTimeScan, AMissingNumberEndsReadingAndKeepsWhatWasRead) {
  const Scanned result = scan("2024-03-04 x:15", "%Y-%O-%D %H:%M");
  EXPECT_EQ(result.count, 3);
  EXPECT_EQ(result.time, "2024-03-04 00:00:00.000");
}

TEST(RealTimeScan, FieldsNotReadAre0AndCarried) {
  const Scanned result = scan("2024", "%Y");
  EXPECT_EQ(result.count, 1);
  EXPECT_EQ(result.time, "2023-11-30 00:00:00.000");  // day 0 of month 0 of 2024
}

TEST(RealTimeScan, FieldsThatNameNoTimeLeaveItUnset) {
  const Scanned result = scan("09:07:03", "%H:%M:%S");
  EXPECT_EQ(result.count, 3);
  EXPECT_EQ(result.time, "unset");
}

TEST(RealTimeScan, NothingReadLeavesTheValue) {
  const struct {
    const char* text;
    const char* format;
  } cases[] = {{"", ""},     {"", "%D"},  {"12", ""},    {"12", "12"},  {"12", "%%"},  {"12", "%q"},
               {"12", "%A"}, {"12", "%"}, {"12", "%05"}, {"x12", "%D"}, {"- 1", "%D"}, {"\xff", "%D"}};
  for (const auto& c : cases) {
    const Scanned result = scan(c.text, c.format);
    EXPECT_EQ(result.count, 0) << c.text << " " << c.format;
    EXPECT_EQ(result.time, kUnchanged) << c.text << " " << c.format;
  }
}

TEST(RealTimeScan, OtherLettersReadNothing) {
  for (int byte = 1; byte < 256; ++byte) {
    const char letter = static_cast<char>(byte);
    if (std::string("DdOoHhMmSsLlYy#-.0123456789").find(letter) != std::string::npos) continue;
    EXPECT_EQ(scan("12", (std::string("%") + letter).c_str()).count, 0) << byte;
  }
}

TEST(RealTimeScan, PercentSignsAndOtherLettersDoNotMoveOn) {
  EXPECT_EQ(scan("12%2024-3-4", "%%%A%q%Y").count, 1);
  EXPECT_EQ(scan("2024%-3-4", "%Y%%-%o-%d").time, "2024-03-04 00:00:00.000");
}

TEST(RealTimeScan, FlagsAreSkipped) {
  EXPECT_EQ(scan("2024-03-04.045", "%04Y-%02O-%-#9D.%03L").time, "2024-03-04 00:00:00.045");
  EXPECT_EQ(scan("20-3-4", "%2Y-%o-%d").count, 3);
}

TEST(RealTimeScan, SpacesBeforeANumberAreSkipped) {
  EXPECT_EQ(scan(" 2024-\t\n3-  4", "%Y-%o-%D").time, "2024-03-04 00:00:00.000");
}

TEST(RealTimeScan, ANumberIsLookedForInTheNext256Characters) {
  const std::string near = std::string(255, ' ') + "7";
  const std::string far = std::string(256, ' ') + "7";
  EXPECT_EQ(scan(near.c_str(), "%D").count, 1);
  EXPECT_EQ(scan(far.c_str(), "%D").count, 0);
}

TEST(RealTimeScan, LongRunsOfSpacesAndZerosAreNotWalkedByEveryDirective) {
  std::string format;
  for (int i = 0; i < 50000; ++i) format += " %d";
  EXPECT_EQ(scan(std::string(1000000, ' ').c_str(), format.c_str()).count, 0);
  format.clear();
  for (int i = 0; i < 50000; ++i) format += "0%h";
  EXPECT_EQ(scan(std::string(1000000, '0').c_str(), format.c_str()).count, 50000);
}

TEST(RealTimeScan, NullTextsReadNothing) {
  EXPECT_EQ(scan(nullptr, "%D").count, 0);
  EXPECT_EQ(scan("12", nullptr).count, 0);
  EXPECT_EQ(scan(nullptr, nullptr).time, kUnchanged);
}

TEST(RealTimeScan, TextIsLocalWithoutTheFlag) {
  const InZone zone("Asia/Kolkata");
  CRealTime time;
  EXPECT_EQ(time.Scan("2026-03-05 14:37", "%Y-%O-%D %H:%M", false), 5);
  EXPECT_EQ(time.Format("%Y-%O-%D %H:%M", true), "2026-03-05 09:07");
}

TEST(RealTimeScan, ReadsBackEveryFormatThatNamesAllFields) {
  const char* formats[] = {"%Y-%O-%D %H:%M:%S.%03L",           "%Y/%o/%d %h:%m:%s.%L",
                           "%d.%o.%y, %H u %M min %S s %L ms", "%L|%S|%M|%H|%D|%O|%Y",
                           "%8L:%-5s:%.3m:%5h;%05d;%.2o;%Y",   "%A! %D %n! %O %Y, %H:%M:%S;%L"};
  std::mt19937_64 random(19700101);
  for (int round = 0; round < 4000; ++round) {
    const std::uint64_t milliseconds = random() % (std::uint64_t{1167609600} * 1000);  // 2000 to 2036
    const CRealTime time(file_time_of(ticks_of_unix(946684800, milliseconds * 10000).value()));
    for (const char* format : formats) {
      const std::string text = time.Format(format, true);
      CRealTime back;
      ASSERT_EQ(back.Scan(text.c_str(), format, true), 7) << text << " " << format;
      ASSERT_EQ(ticks_in(back), ticks_in(time)) << text << " " << format;
    }
  }
}

TEST(RealTimeScan, ReadsBackLocalTextsOfFourZonesAsTheTextConstructorDoes) {
  std::mt19937_64 random(4);
  for (const char* name : {"UTC", "Europe/Amsterdam", "Australia/Sydney", "Asia/Kolkata"}) {
    const InZone zone(name);
    for (int round = 0; round < 1500; ++round) {
      const std::uint64_t milliseconds = random() % (std::uint64_t{1167609600} * 1000);
      const CRealTime time(file_time_of(ticks_of_unix(946684800, milliseconds * 10000).value()));
      const std::string text = time.Format("%D-%O-%Y %H:%M:%S.%03L", false);
      CRealTime scanned;
      ASSERT_EQ(scanned.Scan(text.c_str(), "%D-%O-%Y %H:%M:%S.%L", false), 7) << text;
      ASSERT_EQ(ticks_in(scanned), ticks_in(CRealTime(text.c_str(), false))) << text;
      // Near a change of offset the way back may be off by the change, never by more.
      const auto distance = static_cast<std::int64_t>(ticks_in(scanned) - ticks_in(time));
      ASSERT_TRUE(distance == 0 || distance == -36000000000 || distance == 36000000000) << text << " " << name;
    }
  }
}

TEST(RealTimeScan, RandomTextsAndFormatsGiveACountOrMinusOne) {
  std::mt19937 random(20260305);
  const std::string text_alphabet = "0123456789-+:. /xY%\t";
  const std::string format_alphabet = "%%%%%%#-.059DdOoHhMmSsLlYyAq:-. /";
  for (int round = 0; round < 50000; ++round) {
    std::string text;
    std::string format;
    for (std::size_t left = random() % 40; left > 0; --left) text += text_alphabet[random() % text_alphabet.size()];
    for (std::size_t left = random() % 40; left > 0; --left)
      format += format_alphabet[random() % format_alphabet.size()];
    CRealTime time = kBefore;
    const int count = time.Scan(text.c_str(), format.c_str(), true);
    ASSERT_GE(count, -1);
    ASSERT_LE(count, static_cast<int>(format.size() / 2));
    if (count <= 0) {
      ASSERT_EQ(ticks_in(time), ticks_in(kBefore)) << text << " " << format;
    }
  }
}

}  // namespace
}  // namespace vexa

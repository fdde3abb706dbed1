// SPDX-License-Identifier: Apache-2.0
#include "runtime/real_time_format.h"

#include <gtest/gtest.h>

#include <ctime>
#include <random>
#include <string>

#include "runtime/file_time.h"
#include "tests/runtime/in_zone.h"

namespace vexa {
namespace {

using test::InZone;

const CRealTime kMarch5(2026, 3, 5, 9, 7, 3, 45, 0, true);

/// Parts with these fields and otherwise ordinary values.
TimeParts parts_with(const _SYSTEMTIME& fields) { return {fields, {2026, 10}, 64}; }

TEST(RealTimeFormat, EveryLetterWritesItsField) {
  const InZone zone("UTC");
  const struct {
    const char* format;
    const char* text;
  } cases[] = {{"%%", "%"},    {"%A", "Thursday"}, {"%a", "Thu"},   {"%B", "March"}, {"%b", "Mar"}, {"%N", "maart"},
               {"%n", "maa"},  {"%Y", "2026"},     {"%y", "26"},    {"%O", "03"},    {"%o", "3"},   {"%D", "05"},
               {"%d", "5"},    {"%H", "09"},       {"%h", "9"},     {"%M", "07"},    {"%m", "7"},   {"%S", "03"},
               {"%s", "3"},    {"%L", "45"},       {"%03L", "045"}, {"%l", "05"},    {"%W", "10"},  {"%w", "10"},
               {"%G", "2026"}, {"%g", "26"},       {"%X", "64"},    {"%x", "31"}};
  for (const auto& c : cases) EXPECT_EQ(kMarch5.Format(c.format, true), c.text) << c.format;
}

TEST(RealTimeFormat, FlagsAreHonouredWhereANameOrPlainNumberIsWritten) {
  const InZone zone("UTC");
  const struct {
    const char* format;
    const char* text;
  } cases[] = {{"[%9A]", "[ Thursday]"}, {"[%-4a]", "[Thu ]"}, {"[%.2B]", "[Ma]"},  {"[%5.1b]", "[    M]"},
               {"[%6N]", "[ maart]"},    {"[%-4n]", "[maa ]"}, {"[%03o]", "[003]"}, {"[%3d]", "[  5]"},
               {"[%-3h]", "[9  ]"},      {"[%.3m]", "[007]"},  {"[%02s]", "[03]"},  {"[%4L]", "[  45]"},
               {"[%04w]", "[0010]"},     {"[%03X]", "[064]"},  {"[%#4x]", "[  31]"}};
  for (const auto& c : cases) EXPECT_EQ(kMarch5.Format(c.format, true), c.text) << c.format;
}

TEST(RealTimeFormat, FlagsAreDroppedElsewhere) {
  const InZone zone("UTC");
  const char* letters[] = {"Y", "y", "O", "D", "H", "M", "S", "l", "W", "G", "g", "%"};
  for (const std::string letter : letters) {
    EXPECT_EQ(kMarch5.Format(("%-09" + letter).c_str(), true), kMarch5.Format(("%" + letter).c_str(), true)) << letter;
  }
}

TEST(RealTimeFormat, EveryMonthAndDayHasItsNames) {
  const char* months[] = {"January Jan januari jan", "February Feb februari feb", "March Mar maart maa",
                          "April Apr april apr",     "May May mei mei",           "June Jun juni jun",
                          "July Jul juli jul",       "August Aug augustus aug",   "September Sep september sep",
                          "October Oct oktober okt", "November Nov november nov", "December Dec december dec"};
  for (std::uint16_t month = 1; month <= 12; ++month) {
    EXPECT_EQ(format_time("%B %b %N %n", parts_with({2026, month, 0, 1, 0, 0, 0, 0})), months[month - 1]);
  }
  const char* days[] = {"Sunday Sun",   "Monday Mon", "Tuesday Tue", "Wednesday Wed",
                        "Thursday Thu", "Friday Fri", "Saturday Sat"};
  for (std::uint16_t day = 0; day <= 6; ++day) {
    EXPECT_EQ(format_time("%A %a", parts_with({2026, 1, day, 1, 0, 0, 0, 0})), days[day]);
  }
}

TEST(RealTimeFormat, MonthsAndDaysOutsideTheTablesAreUnknown) {
  for (const int month : {0, 13, 65535}) {
    const _SYSTEMTIME fields{2026, static_cast<std::uint16_t>(month), 0, 1, 0, 0, 0, 0};
    EXPECT_EQ(format_time("%B %b %N %n %x", parts_with(fields)), "Unknown *** onbekend *** -1") << month;
  }
  for (const int day : {7, 65535}) {
    const _SYSTEMTIME fields{2026, 1, static_cast<std::uint16_t>(day), 1, 0, 0, 0, 0};
    EXPECT_EQ(format_time("%A %a", parts_with(fields)), "Unknown ***") << day;
  }
}

TEST(RealTimeFormat, HundredthsAreRoundedAndNeverReachTheNextSecond) {
  const struct {
    std::uint16_t milliseconds;
    const char* text;
  } cases[] = {{0, "00"},  {4, "00"},   {5, "01"},   {14, "01"},  {15, "02"},  {94, "09"},
               {95, "10"}, {984, "98"}, {985, "99"}, {994, "99"}, {996, "99"}, {999, "99"}};
  for (const auto& c : cases) {
    EXPECT_EQ(format_time("%l", parts_with({2026, 1, 0, 1, 0, 0, 0, c.milliseconds})), c.text) << c.milliseconds;
  }
}

TEST(RealTimeFormat, EveryNumberIsWrittenOverItsWholeRange) {
  const struct {
    const char* format;
    const char* text;
  } cases[] = {{"%Y %y", "0007 07"}, {"%O %o", "12 12"}, {"%D %d", "31 31"}, {"%H %h", "23 23"},
               {"%M %m", "59 59"},   {"%S %s", "00 0"},  {"%L", "999"},      {"%W %w", "01 1"},
               {"%G %g", "0006 06"}, {"%X", "366"},      {"%x", "31"}};
  const TimeParts parts{{7, 12, 0, 31, 23, 59, 0, 999}, {6, 1}, 366};
  for (const auto& c : cases) EXPECT_EQ(format_time(c.format, parts), c.text) << c.format;
}

TEST(RealTimeFormat, OtherLettersAreCopiedWithTheirFlags) {
  for (const char* format : {"%C", "%05C", "%q", "% d", "%+d", "%*d", "%\n", "%-", "%", "%5-d", "%1.2.3A"}) {
    EXPECT_EQ(kMarch5.Format(format, true), format) << format;
  }
}

TEST(RealTimeFormat, EveryByteOutsideTheTableIsCopied) {
  const std::string known = "%AaBbNnYyOoDdHhMmSsLlWwGgXx#-.0123456789";
  for (int byte = 1; byte < 256; ++byte) {
    const char letter = static_cast<char>(byte);
    if (known.find(letter) != std::string::npos) continue;
    const std::string format = std::string("%03") + letter + "|";
    EXPECT_EQ(kMarch5.Format(format.c_str(), true), format) << byte;
  }
}

TEST(RealTimeFormat, LocalTimeIsWrittenUnlessUtcIsAskedFor) {
  const InZone zone("Asia/Kolkata");
  EXPECT_EQ(kMarch5.Format("%D-%O-%Y %H:%M:%S.%03L", true), "05-03-2026 09:07:03.045");
  EXPECT_EQ(kMarch5.Format("%D-%O-%Y %H:%M:%S.%03L", false), "05-03-2026 14:37:03.045");
}

TEST(RealTimeFormat, WeekAndDayOfTheYearAreLocalInUtcToo) {
  const InZone zone("Asia/Kolkata");
  const CRealTime new_year(2024, 12, 31, 20, 0, 0, 0, 0, true);
  EXPECT_EQ(new_year.Format("%Y %X %w %G %x", true), "2024 1 1 2025 31");
  EXPECT_EQ(new_year.Format("%Y %X %w %G %x", false), "2025 1 1 2025 31");
  const CRealTime february(2024, 2, 29, 20, 0, 0, 0, 0, true);
  EXPECT_EQ(february.Format("%x %X", true), "29 61");
  EXPECT_EQ(february.Format("%x %X", false), "31 61");
}

TEST(RealTimeFormat, TheLogLinesStampIsReadBackByTheTextConstructor) {
  const InZone zone("Europe/Amsterdam");
  const std::string text = kMarch5.Format("%D-%O-%Y %H:%M:%S.%03L", false);
  EXPECT_EQ(text, "05-03-2026 10:07:03.045");
  EXPECT_EQ(ticks_of(CRealTime(text.c_str(), false).GetUtcFileTime()), ticks_of(kMarch5.GetUtcFileTime()));
}

TEST(RealTimeFormat, NoFormatGivesNoText) { EXPECT_EQ(kMarch5.Format(nullptr, true), ""); }

TEST(RealTimeFormat, CopyingStopsAfter241CharactersAndCutsAt255) {
  EXPECT_EQ(kMarch5.Format(std::string(300, 'x').c_str(), true), std::string(241, 'x'));
  EXPECT_EQ(kMarch5.Format((std::string(240, 'x') + "%20N").c_str(), true),
            std::string(255 - 15, 'x') + std::string(15, ' '));
  EXPECT_EQ(kMarch5.Format((std::string(240, 'x') + "%-99A").c_str(), true), std::string(240, 'x') + "Thursday       ");
  EXPECT_EQ(kMarch5.Format((std::string(241, 'x') + "%A").c_str(), true), std::string(241, 'x'));
}

TEST(RealTimeFormat, APieceWiderThanTheRoomIsCutToWhatFits) {
  const InZone zone("UTC");
  const struct {
    const char* format;
    std::string text;
  } cases[] = {{"%1000d", std::string(255, ' ')},          {"%1000A", std::string(255, ' ')},
               {"%255d", std::string(254, ' ') + "5"},     {"%256d", std::string(255, ' ')},
               {"%-1000d", "5" + std::string(254, ' ')},   {"%01000d", std::string(255, '0')},
               {"ab%1000d", "ab" + std::string(253, ' ')}, {"ab%253dcd", "ab" + std::string(252, ' ') + "5"}};
  for (const auto& c : cases) EXPECT_EQ(kMarch5.Format(c.format, true), c.text) << c.format;
}

TEST(RealTimeFormat, RandomFormatsNeverPassTheLimit) {
  std::mt19937 random(20260305);
  const std::string alphabet = "%%%%%#-.0123456789AaBbNnYyOoDdHhMmSsLlWwGgXxqz \n";
  for (int round = 0; round < 5000; ++round) {
    std::string format;
    const std::size_t length = random() % 400;
    while (format.size() < length) format += alphabet[random() % alphabet.size()];
    ASSERT_LE(kMarch5.Format(format.c_str(), round % 2 == 0).size(), 255U) << format;
  }
}

TEST(RealTimeFormat, UtcTextsEqualTheCLibrarysAtRandomMoments) {
  std::mt19937 random(1601);
  for (int round = 0; round < 5000; ++round) {
    const auto seconds = static_cast<std::time_t>(random() % 2147483647U);
    std::tm time{};
    gmtime_r(&seconds, &time);
    char expected[96] = {};
    std::strftime(expected, sizeof expected, "%Y-%m-%d %H:%M:%S %A %a %B %b", &time);
    ASSERT_EQ(CRealTime(seconds, true).Format("%Y-%O-%D %H:%M:%S %A %a %B %b", true), expected) << seconds;
  }
}

}  // namespace
}  // namespace vexa

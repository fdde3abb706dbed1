// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/directive.h"

#include <gtest/gtest.h>

#include <climits>
#include <cstdio>

namespace vexa {
namespace {

std::string number_with(const char* flags, std::int64_t value) {
  const auto parsed = parse_field_flags(flags);
  return parsed ? number_field(value, *parsed) : "no flags";
}

std::string text_with(const char* flags, const char* text) {
  const auto parsed = parse_field_flags(flags);
  return parsed ? text_field(text, *parsed) : "no flags";
}

/// Knows the letters n, a number, and s, a text.
std::string expand(const char* format) {
  return expand_directives(format, [](char letter, const FieldFlags& flags) -> std::optional<std::string> {
    if (letter == 'n') return number_field(7, flags);
    if (letter == 's') return text_field("word", flags);
    return std::nullopt;
  });
}

#define EXPECT_NUMBER_AS_PRINTF(flags)                                                     \
  for (const int value : {0, 1, 7, 12, 99, 100, 2026, 65535, -1, -45, INT_MIN, INT_MAX}) { \
    char expected[64];                                                                     \
    std::snprintf(expected, sizeof expected, "%" flags "d", value);                        \
    EXPECT_EQ(number_with(flags, value), expected) << flags;                               \
  }                                                                                        \
  static_assert(true)

TEST(Directive, NumbersArePaddedAsPrintfPadsThem) {
  EXPECT_NUMBER_AS_PRINTF("");
  EXPECT_NUMBER_AS_PRINTF("1");
  EXPECT_NUMBER_AS_PRINTF("2");
  EXPECT_NUMBER_AS_PRINTF("5");
  EXPECT_NUMBER_AS_PRINTF("12");
  EXPECT_NUMBER_AS_PRINTF("02");
  EXPECT_NUMBER_AS_PRINTF("03");
  EXPECT_NUMBER_AS_PRINTF("012");
  EXPECT_NUMBER_AS_PRINTF("-5");
  EXPECT_NUMBER_AS_PRINTF("-12");
  EXPECT_NUMBER_AS_PRINTF(".0");
  EXPECT_NUMBER_AS_PRINTF(".");
  EXPECT_NUMBER_AS_PRINTF(".3");
  EXPECT_NUMBER_AS_PRINTF(".12");
  EXPECT_NUMBER_AS_PRINTF("8.3");
  EXPECT_NUMBER_AS_PRINTF("-8.3");
  EXPECT_NUMBER_AS_PRINTF("2.5");
}

TEST(Directive, FlagsThatYieldToOthersDoSo) {
  EXPECT_EQ(number_with("-05", 42), "42   ");
  EXPECT_EQ(number_with("0-5", 42), "42   ");
  EXPECT_EQ(number_with("05.1", 42), "   42");
  EXPECT_EQ(number_with("#5", 42), "   42");
  EXPECT_EQ(number_with("0", 42), "42");
  EXPECT_EQ(number_with("--5", 42), "42   ");
  EXPECT_EQ(number_with("0005", 42), "00042");
}

TEST(Directive, NumbersMayHave64Bits) {
  EXPECT_EQ(number_with("", INT64_MAX), "9223372036854775807");
  EXPECT_EQ(number_with("21", INT64_MIN), " -9223372036854775808");
}

TEST(Directive, TextsArePaddedAndCutAsPrintfDoesIt) {
  const struct {
    const char* flags;
    const char* text;
  } cases[] = {{"", "maart"},     {"3", "maart"},     {"8", "   maart"}, {"-8", "maart   "}, {".3", "maa"},
               {"6.2", "    ma"}, {"-6.2", "ma    "}, {".0", ""},        {".", ""},          {"08", "   maart"}};
  for (const auto& c : cases) EXPECT_EQ(text_with(c.flags, "maart"), c.text) << c.flags;
}

TEST(Directive, FlagsInAnOrderPrintfDoesNotKnowHaveNoMeaning) {
  for (const char* flags : {"5-", "5#", ".-5", ".5-", "1.2.3", "..", "5.#", "x"}) {
    EXPECT_FALSE(parse_field_flags(flags)) << flags;
  }
}

TEST(Directive, WidthsAreBoundedByTheLongestText) {
  EXPECT_EQ(number_with("99999999999999999999999", 1).size(), kDirectiveTextLimit);
  EXPECT_EQ(number_with(".99999999999999999999999", 1).size(), kDirectiveTextLimit);
  EXPECT_EQ(number_with("255", 1).size(), 255U);
  EXPECT_EQ(number_with("254", 1).size(), 254U);
}

TEST(Directive, AFieldWiderThanTheLongestTextIsCutAtItsEnd) {
  const std::string blanks(kDirectiveTextLimit, ' ');
  const std::string zeros(kDirectiveTextLimit, '0');
  const struct {
    const char* flags;
    std::string text;
  } cases[] = {{"255", blanks.substr(2) + "-7"},
               {"256", blanks.substr(1) + "-"},
               {"257", blanks},
               {"1000", blanks},
               {"2147483647", blanks},
               {"99999999999999999999999", blanks},
               {"-1000", "-7" + blanks.substr(2)},
               {"01000", "-" + zeros.substr(1)},
               {".1000", "-" + zeros.substr(1)},
               {"1000.600", blanks},
               {"-1000.600", "-" + zeros.substr(1)},
               {"700.600", blanks.substr(156) + "-" + zeros.substr(100)},
               {"-700.100", "-" + zeros.substr(156) + "7" + blanks.substr(101)}};
  for (const auto& c : cases) EXPECT_EQ(number_with(c.flags, -7), c.text) << c.flags;
  EXPECT_EQ(text_with("1000", "maart"), blanks);
  EXPECT_EQ(text_with("258", "maart"), blanks.substr(2) + "ma");
  EXPECT_EQ(text_with("-1000.2", "maart"), "ma" + blanks.substr(2));
}

TEST(Directive, TwoAndFourDigitsGrowWithTheNumber) {
  EXPECT_EQ(two_digits(7), "07");
  EXPECT_EQ(two_digits(100), "100");
  EXPECT_EQ(two_digits(-1), "-1");
  EXPECT_EQ(four_digits(33), "0033");
  EXPECT_EQ(four_digits(10000), "10000");
}

TEST(Directive, KnownLettersAreReplacedAndTheRestIsCopied) {
  const struct {
    const char* format;
    const char* text;
  } cases[] = {{"", ""},
               {"plain", "plain"},
               {"%n", "7"},
               {"[%03n]", "[007]"},
               {"%-6s|", "word  |"},
               {"%%", "%"},
               {"%5%", "%"},
               {"%q", "%q"},
               {"%05q!", "%05q!"},
               {"%5-n", "%5-n"},
               {"a%", "a%"},
               {"a%05", "a%05"},
               {"%%n", "%n"},
               {"%n%n", "77"},
               {"%\xff", "%\xff"},
               {"%1.2.3s", "%1.2.3s"}};
  for (const auto& c : cases) EXPECT_EQ(expand(c.format), c.text) << c.format;
}

TEST(Directive, NoFormatGivesNoText) { EXPECT_EQ(expand(nullptr), ""); }

TEST(Directive, CopyingStopsAfter241Characters) {
  EXPECT_EQ(expand(std::string(240, 'x').c_str()), std::string(240, 'x'));
  EXPECT_EQ(expand(std::string(241, 'x').c_str()), std::string(241, 'x'));
  EXPECT_EQ(expand(std::string(242, 'x').c_str()), std::string(241, 'x'));
  EXPECT_EQ(expand((std::string(241, 'x') + "%n").c_str()), std::string(241, 'x'));
}

TEST(Directive, APieceIsCutWhere255CharactersAreWritten) {
  const std::string almost(240, 'x');
  EXPECT_EQ(expand((almost + "%14n.").c_str()), almost + std::string(13, ' ') + "7");
  EXPECT_EQ(expand((almost + "%15n.").c_str()), almost + std::string(14, ' ') + "7");
  EXPECT_EQ(expand((almost + "%16n.").c_str()), almost + std::string(15, ' '));
  EXPECT_EQ(expand((almost + "%999999n").c_str()), almost + std::string(15, ' '));
}

TEST(Directive, ALongRunOfFlagsIsCutToo) {
  const std::string run = "%" + std::string(100000, '5');
  EXPECT_EQ(expand((run + "q").c_str()), run.substr(0, 255));
  EXPECT_EQ(expand(run.c_str()), run.substr(0, 255));
  EXPECT_EQ(expand((run + "n").c_str()), std::string(255, ' '));
  EXPECT_EQ(expand(("%" + std::string(100000, '0') + "2n").c_str()), "07");
}

}  // namespace
}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/base64.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

std::string decoded(std::string_view text) {
  const auto bytes = base64_decode(text);
  return {bytes.begin(), bytes.end()};
}

TEST(Base64Encode, PadsTheLastGroup) {
  const struct {
    std::string_view bytes, text;
  } cases[] = {{"", ""},
               {"f", "Zg=="},
               {"fo", "Zm8="},
               {"foo", "Zm9v"},
               {"foob", "Zm9vYg=="},
               {"fooba", "Zm9vYmE="},
               {"foobar", "Zm9vYmFy"},
               {":", "Og=="},
               {"\xff\xef\xbe", "/+++"}};
  for (const auto& c : cases) EXPECT_EQ(base64_encode(c.bytes), c.text);
}

TEST(Base64Encode, CarriesEveryByteValue) {
  for (int value = 0; value < 256; ++value) {
    const std::string bytes = {static_cast<char>(value), static_cast<char>(255 - value), static_cast<char>(value / 2)};
    EXPECT_EQ(decoded(base64_encode(bytes)), bytes);
  }
}

TEST(Base64Decode, IgnoresATailShorterThanAGroup) {
  EXPECT_EQ(decoded("QUJD"), "ABC");
  for (const char* text : {"", "Q", "QU", "QUJ"}) EXPECT_EQ(decoded(text), "") << text;
  for (const char* text : {"QUJDR", "QUJDRE", "QUJDREV"}) EXPECT_EQ(decoded(text), "ABC") << text;
}

TEST(Base64Decode, CountsPaddingAndStrangeCharactersAsZero) {
  EXPECT_EQ(decoded("QUI="), std::string("AB\0", 3));
  EXPECT_EQ(decoded("===="), std::string(3, '\0'));
  EXPECT_EQ(decoded("Q?JD"), decoded("QAJD"));
  EXPECT_EQ(decoded("QUJ\xff"), decoded("QUJA"));
  EXPECT_EQ(decoded("QU\nD"), decoded("QUAD"));
}

}  // namespace
}  // namespace vexa

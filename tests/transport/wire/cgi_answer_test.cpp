#include "transport/wire/cgi_answer.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

TEST(CgiValue, GoesUpToTheNextPairOrTheEnd) {
  const struct {
    std::string_view answer, key, value;
  } cases[] = {{"ModelName=X1&Serial=7", "ModelName=", "X1"},
               {"ModelName=X1&Serial=7", "Serial=", "7"},
               {"A=&B=1", "A=", ""},
               {"A=", "A=", ""},
               {"A=1&A=2", "A=", "1"},
               {"A=x=y&B=1", "A=", "x=y"},
               {"A=b%20c", "A=", "b%20c"},
               {"A= b ", "A=", " b "},
               {"A=1\r\n&B=2", "A=", "1\r\n"}};
  for (const auto& c : cases) EXPECT_EQ(cgi_value(c.answer, c.key), c.value) << c.answer << " " << c.key;
}

TEST(CgiValue, IsNoneWithoutTheKey) {
  for (const char* answer : {"", "B=1", "a=1", "A", "&&&&"}) EXPECT_EQ(cgi_value(answer, "A="), std::nullopt) << answer;
}

TEST(CgiValue, FindsAKeyInsideALongerOne) {
  EXPECT_EQ(cgi_value("DigitalZoom=on&Zoom=2", "Zoom="), "on");
  EXPECT_EQ(cgi_value("Zoom=2&DigitalZoom=on", "Zoom="), "2");
}

TEST(CgiValue, IsEveryPrefixOfACutAnswer) {
  constexpr std::string_view kAnswer = "Serial=1234&MacAddress=00:11";
  for (std::size_t length = 0; length <= kAnswer.size(); ++length) {
    const std::string_view cut = kAnswer.substr(0, length);
    if (length < 7) {
      EXPECT_EQ(cgi_value(cut, "Serial="), std::nullopt) << length;
    } else {
      EXPECT_EQ(cgi_value(cut, "Serial="), kAnswer.substr(7, std::min<std::size_t>(length - 7, 4))) << length;
    }
  }
}

}  // namespace
}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/http_request.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

constexpr std::string_view kSpared = "$-_.+!*'(),/?&#=";

TEST(HttpGetRequest, NamesTheCameraAndCarriesTheCredentials) {
  const Formatted request = http_get_request({"cam", 80, "/command/main.cgi?x=1", "YTpi"});
  EXPECT_EQ(request.text, "GET http://cam:80/command/main.cgi?x=1 HTTP/1.0\r\nAuthorization: Basic YTpi\r\n\r\n");
  EXPECT_FALSE(request.cut);
}

TEST(HttpGetRequest, Takes1023CharactersAndNoMore) {
  const std::size_t around = http_get_request({"cam", 80, "", "YTpi"}).text.size();
  for (const std::size_t length : {1022U, 1023U, 1024U, 5000U}) {
    const Formatted request = http_get_request({"cam", 80, std::string(length - around, 'x'), "YTpi"});
    EXPECT_EQ(request.cut, length > 1023) << length;
    EXPECT_EQ(request.text.size(), std::min<std::size_t>(length, 1023));
  }
}

TEST(JoinedCredentials, HoldAColonEvenWhenBothAreEmpty) {
  EXPECT_EQ(joined_credentials("", ""), ":");
  EXPECT_EQ(joined_credentials("admin", "secret"), "admin:secret");
  EXPECT_EQ(joined_credentials("%s%n", "a:b"), "%s%n:a:b");
}

TEST(JoinedCredentials, AreCutAt255Characters) {
  for (const std::size_t password : {250U, 251U, 252U, 255U, 4000U}) {
    const std::string whole = "usr:" + std::string(password, 'p');
    EXPECT_EQ(joined_credentials("usr", std::string(password, 'p')), whole.substr(0, 255)) << password;
  }
}

TEST(PercentEncoded, CopiesLettersDigitsAndWhatIsSpared) {
  std::string every;
  for (int c = 0; c < 256; ++c) every += static_cast<char>(c);
  std::string expected;
  for (const char c : every) {
    const bool plain = (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
    char escaped[4];
    std::snprintf(escaped, sizeof escaped, "%%%02X", static_cast<unsigned>(static_cast<unsigned char>(c)));
    expected += plain || (c != '\0' && kSpared.find(c) != std::string_view::npos) ? std::string(1, c) : escaped;
  }
  EXPECT_EQ(percent_encoded(every, kSpared), expected);
  EXPECT_EQ(percent_encoded("", kSpared), "");
}

TEST(AsOneWord, EncodesBlanksAndControlCharactersAndWhatIsNamedAlone) {
  std::string every;
  for (int c = 0; c < 256; ++c) every += static_cast<char>(c);
  std::string expected;
  for (const char c : every) {
    const unsigned byte = static_cast<unsigned char>(c);
    char escaped[4];
    std::snprintf(escaped, sizeof escaped, "%%%02X", byte);
    expected += byte <= 32 || byte == 127 || c == '&' ? escaped : std::string(1, c);
  }
  EXPECT_EQ(as_one_word(every, "&"), expected);
  EXPECT_EQ(as_one_word("a&b c", ""), "a&b%20c");
  EXPECT_EQ(as_one_word("", "&"), "");
}

}  // namespace
}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
#include "host/serve/gate.h"

#include <gtest/gtest.h>

#include <functional>

namespace vexa::host {
namespace {

const std::string kToken = "0123456789abcdef";
const std::string kCookie = "fedcba9876543210";

const Gate& gate() {
  static const Gate made(8080, {"wall.example", "other.example:444"}, kToken, kCookie);
  return made;
}

// A visitor that is let in, changed.
Admission admit(const std::function<void(Visitor&)>& change) {
  static const std::string kBearer = "Bearer " + kToken;
  Visitor visitor;
  visitor.method = "GET";
  visitor.path = "/metrics";
  visitor.host = "127.0.0.1:8080";
  visitor.authorization = kBearer;
  change(visitor);
  return gate().admit(visitor);
}

TEST(Gate, LetsInWhoPresentsTheToken) {
  EXPECT_EQ(admit([](Visitor&) {}), Admission::kEnter);
}

TEST(Gate, LetsInWhoPresentsTheCookie) {
  for (const char* cookie : {"vexa=fedcba9876543210", "a=b; vexa=fedcba9876543210; c=d"}) {
    EXPECT_EQ(admit([&](Visitor& visitor) {
                visitor.authorization = "";
                visitor.cookie = cookie;
              }),
              Admission::kEnter)
        << cookie;
  }
}

TEST(Gate, RefusesAMissingOrWrongTokenOnEveryPath) {
  for (const char* path : {"/metrics", "/wall.js", "/wall.css", "/ws", "/api/cameras", "/healthz", "/readyz",
                           "/openapi.json", "/cameras/a/picture.jpg", "/nothing", "/session"}) {
    for (const char* field : {"", "Bearer ", "Bearer 0123456789abcdeX", "Bearer 0123456789abcdef0",
                              "Basic 0123456789abcdef", "0123456789abcdef"}) {
      EXPECT_EQ(admit([&](Visitor& visitor) {
                  visitor.path = path;
                  visitor.authorization = field;
                  visitor.cookie = "vexa=; vexa=0123456789abcdef; xvexa=fedcba9876543210";
                }),
                Admission::kUnauthorized)
          << path << " " << field;
    }
  }
}

TEST(Gate, ShowsTheSignInPageAndItsScriptToAnybody) {
  for (const char* path : {"/", "/sign-in.js"}) {
    EXPECT_EQ(admit([&](Visitor& visitor) {
                visitor.path = path;
                visitor.authorization = "";
              }),
              Admission::kSignIn);
  }
}

TEST(Gate, TradesTheTokenOfAPostForTheCookie) {
  const auto trade = [](const char* token, const char* type) {
    return admit([&](Visitor& visitor) {
      visitor.method = "POST";
      visitor.path = "/session";
      visitor.authorization = "";
      visitor.token = token;
      visitor.content_type = type;
    });
  };
  EXPECT_EQ(trade("0123456789abcdef", "application/json"), Admission::kTrade);
  EXPECT_EQ(trade("0123456789abcdee", "application/json"), Admission::kUnauthorized);
  EXPECT_EQ(trade("0123456789abcdef", "text/plain"), Admission::kUnauthorized);
  EXPECT_EQ(gate().cookie_field(), "vexa=fedcba9876543210; HttpOnly; SameSite=Strict; Path=/");
}

TEST(Gate, KnowsItsOwnNamesAndThoseItIsGiven) {
  for (const char* host : {"localhost:8080", "localhost.:8080", "LOCALHOST:8080", "[::1]:8080", "wall.example",
                           "wall.example:443", "other.example:444"}) {
    EXPECT_EQ(admit([&](Visitor& visitor) { visitor.host = host; }), Admission::kEnter) << host;
  }
  for (const char* host : {"evil.example:8080", "127.0.0.1:8081", "127.0.0.1", "127.0.0.1.evil.example:8080",
                           "other.example", "other.example:8080", "localhost:80808", "192.0.2.1:8080"}) {
    EXPECT_EQ(admit([&](Visitor& visitor) { visitor.host = host; }), Admission::kMisdirected) << host;
  }
  EXPECT_EQ(admit([&](Visitor& visitor) { visitor.host = ""; }), Admission::kBadRequest);
}

TEST(Gate, RefusesPagesOfOtherOriginsEvenWithTheCookie) {
  for (const char* origin : {"http://evil.example", "null", "http://127.0.0.1:8081", "http://127.0.0.1",
                             "http://127.0.0.1:8080.evil.example", "file://127.0.0.1:8080"}) {
    EXPECT_EQ(admit([&](Visitor& visitor) { visitor.origin = origin; }), Admission::kForbidden) << origin;
  }
  for (const char* site : {"cross-site", "same-site", "nonsense"}) {
    EXPECT_EQ(admit([&](Visitor& visitor) { visitor.fetch_site = site; }), Admission::kForbidden) << site;
  }
  EXPECT_EQ(admit([](Visitor& visitor) {
              visitor.origin = "http://127.0.0.1:8080";
              visitor.fetch_site = "same-origin";
            }),
            Admission::kEnter);
}

TEST(Gate, AnEmptySecretFitsNothing) {
  EXPECT_FALSE(same_secret("", ""));
  EXPECT_TRUE(same_secret("a", "a"));
  EXPECT_FALSE(same_secret("a", "b"));
}

TEST(RandomToken, Has128BitsAndIsAnotherEachTime) {
  const std::string token = random_token();
  EXPECT_EQ(token.size(), 32U);
  EXPECT_EQ(token.find_first_not_of("0123456789abcdef"), std::string::npos);
  EXPECT_NE(token, random_token());
}

}  // namespace
}  // namespace vexa::host

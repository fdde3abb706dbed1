#include "virtual_camera/wire/credentials.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

TEST(Credentials, Base64FollowsTheVectorsOfRfc4648) {
  const struct {
    const char* bytes;
    const char* text;
  } cases[] = {{"", ""},
               {"f", "Zg=="},
               {"fo", "Zm8="},
               {"foo", "Zm9v"},
               {"foob", "Zm9vYg=="},
               {"fooba", "Zm9vYmE="},
               {"foobar", "Zm9vYmFy"},
               {"\xff\xfe\xfd", "//79"}};
  for (const auto& c : cases) EXPECT_EQ(base64_text(c.bytes), c.text) << c.bytes;
}

TEST(Credentials, OnlyTheRightPairIsLetIn) {
  EXPECT_TRUE(credentials_match("Basic YWRtaW46YWRtaW4=", "admin", "admin"));
  EXPECT_FALSE(credentials_match("Basic YWRtaW46YWRtaW4=", "admin", "other"));
  EXPECT_FALSE(credentials_match("Basic YWRtaW46YWRtaW4", "admin", "admin"));
  EXPECT_FALSE(credentials_match("", "admin", "admin"));
  EXPECT_TRUE(credentials_match("Basic Og==", "", ""));
}

TEST(Credentials, EmptyUserAndPasswordLetEveryoneIn) {
  EXPECT_TRUE(credentials_match("", "", ""));
  EXPECT_FALSE(credentials_match("", "", "secret"));
  EXPECT_FALSE(credentials_match("", "user", ""));
}

}  // namespace
}  // namespace vexa::camera

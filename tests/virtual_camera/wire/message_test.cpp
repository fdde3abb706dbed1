// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/wire/message.h"

#include <gtest/gtest.h>

#include <string>

namespace vexa::camera {
namespace {

using namespace std::string_literals;

TEST(Message, HeadEndsAtTheEmptyLine) {
  const struct {
    std::string received;
    std::size_t size;
  } cases[] = {{"", 0},
               {"GET / HTTP/1.0\r\n", 0},
               {"GET / HTTP/1.0\r\n\r", 0},
               {"GET / HTTP/1.0\r\n\r\n", 18},
               {"GET / HTTP/1.0\r\n\r\nmore", 18},
               {"GET / HTTP/1.0\n\n", 16},
               {"A\n\nB\r\n\r\n", 3},
               {"\r\nA\r\n\r\n", 7},
               {"\r\n\r\n", 0},
               {"\r\n\r\n\r\nA\n\n", 9}};
  for (const auto& c : cases) EXPECT_EQ(head_size(c.received), c.size) << c.received;
}

TEST(Message, RequestLineAndFieldsAreTakenApart) {
  const auto head = parse_head(
      "GET http://camera:8080/command/x.cgi?A=1&B=http://y HTTP/1.0\r\nCSeq: 7\r\nempty:\r\nTwo:  words here \r\n\r\n");
  ASSERT_TRUE(head);
  EXPECT_EQ(head->method, "GET");
  EXPECT_EQ(head->target, "http://camera:8080/command/x.cgi?A=1&B=http://y");
  EXPECT_EQ(head->path, "/command/x.cgi");
  EXPECT_EQ(head->query, "A=1&B=http://y");
  EXPECT_EQ(head->version, "HTTP/1.0");
  EXPECT_EQ(head->field("cseq"), "7");
  EXPECT_EQ(head->field("Two"), "words here");
  EXPECT_EQ(head->field("EMPTY"), "");
  EXPECT_EQ(head->field("absent"), "");
}

TEST(Message, PathIsTheTargetWithoutAuthorityAndQuery) {
  const struct {
    std::string target, path, query;
  } cases[] = {{"/a", "/a", ""},     {"/a?", "/a", ""}, {"/a?b=c", "/a", "b=c"},     {"rtsp://h:1/a/b", "/a/b", ""},
               {"http://h", "", ""}, {"*", "*", ""},    {"http://h/a?b", "/a", "b"}, {"/a?b?c", "/a", "b?c"}};
  for (const auto& c : cases) {
    const auto head = parse_head("GET " + c.target + " HTTP/1.0\r\n\r\n");
    ASSERT_TRUE(head) << c.target;
    EXPECT_EQ(head->path, c.path) << c.target;
    EXPECT_EQ(head->query, c.query) << c.target;
  }
}

TEST(Message, NonsenseIsNoHead) {
  const std::string cases[] = {"\r\n\r\n",
                               "GET\r\n\r\n",
                               "GET /\r\n\r\n",
                               "GET / FTP/1.0\r\n\r\n",
                               " / HTTP/1.0\r\n\r\n",
                               "GET a b HTTP/1.0\r\n\r\n",
                               "GET / HTTP/1.0\r\nno colon\r\n\r\n",
                               "GET / HTTP/1.0\r\n: no name\r\n\r\n",
                               "GET /\0 HTTP/1.0\r\n\r\n"s};
  for (const std::string& text : cases) EXPECT_FALSE(parse_head(text)) << text;
}

TEST(Message, EveryCutOfARequestIsReadWithoutHarm) {
  const std::string whole = "SETUP rtsp://h/media/video1/video RTSP/1.0\r\nCSeq: 2\r\nTransport: RTP/AVP\r\n\r\n";
  for (std::size_t size = 0; size < whole.size(); ++size) {
    const std::string cut = whole.substr(0, size);
    EXPECT_EQ(head_size(cut), 0U);
    const auto head = parse_head(cut);
    if (head) {
      EXPECT_EQ(head->method, "SETUP");
    }
  }
  EXPECT_EQ(head_size(whole), whole.size());
}

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

// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/rtsp_request.h"

#include <gtest/gtest.h>

#include <climits>

namespace vexa {
namespace {

const std::string kUrl = "rtsp://10.0.0.9:554/media/video1";
const RtspHead kHead{kUrl, 7, "YTpi"};

TEST(RtspRequest, DescribesTheSession) {
  EXPECT_EQ(rtsp_describe(kHead).text,
            "DESCRIBE rtsp://10.0.0.9:554/media/video1 RTSP/1.0\r\nCSeq: 7\r\nAccept: application/sdp\r\n"
            "Authorization: Basic YTpi\r\n\r\n");
}

TEST(RtspRequest, SetsUpTheTrackNamedVideo) {
  EXPECT_EQ(rtsp_setup_udp(kHead, 40000).text,
            "SETUP rtsp://10.0.0.9:554/media/video1/video RTSP/1.0\r\nCSeq: 7\r\n"
            "Transport: RTP/AVP;unicast;client_port=40000-40001\r\nAuthorization: Basic YTpi\r\n\r\n");
}

TEST(RtspRequest, PlaysFromTheBeginningAtAScale) {
  EXPECT_EQ(rtsp_play(kHead, {12345678, 4}).text,
            "PLAY rtsp://10.0.0.9:554/media/video1 RTSP/1.0\r\nCSeq: 7\r\nSession: 12345678\r\nScale: 4\r\n"
            "Range: npt=0.000-\r\nAuthorization: Basic YTpi\r\n\r\n");
  EXPECT_NE(rtsp_play(kHead, {INT_MIN, -2}).text.find("Session: -2147483648\r\nScale: -2\r\n"), std::string::npos);
}

TEST(RtspRequest, KeepsAliveWithAParameterRequest) {
  EXPECT_EQ(rtsp_get_parameter(kHead, 12345678).text,
            "GET_PARAMETER rtsp://10.0.0.9:554/media/video1 RTSP/1.0\r\nCSeq: 7\r\nSession: 12345678\r\n"
            "Accept: application/sdp\r\nAuthorization: Basic YTpi\r\n\r\n");
}

TEST(RtspRequest, TearsDownWithoutCredentialsAndWithABlankLineMore) {
  EXPECT_EQ(rtsp_teardown(kHead, 12345678).text,
            "TEARDOWN rtsp://10.0.0.9:554/media/video1 RTSP/1.0\r\nCSeq: 7\r\nSession: 12345678\r\n\r\n\r\n");
}

TEST(RtspRequest, Takes1023CharactersAndNoMore) {
  using Request = Formatted (*)(const RtspHead&);
  const Request requests[] = {rtsp_describe, [](const RtspHead& head) { return rtsp_setup_udp(head, 40000); },
                              [](const RtspHead& head) {
                                return rtsp_play(head, {1, 1});
                              },
                              [](const RtspHead& head) { return rtsp_get_parameter(head, 1); },
                              [](const RtspHead& head) { return rtsp_teardown(head, 1); }};
  for (const Request request : requests) {
    const std::string none;
    const std::size_t around = request({none, 7, "YTpi"}).text.size();
    for (const std::size_t length : {1022U, 1023U, 1024U}) {
      const std::string url(length - around, 'u');
      const Formatted formatted = request({url, 7, "YTpi"});
      EXPECT_EQ(formatted.cut, length > 1023) << formatted.text.substr(0, 8) << length;
      EXPECT_EQ(formatted.text.size(), std::min<std::size_t>(length, 1023));
    }
  }
}

TEST(KeepAliveInterval, FollowsTheSessionsTimeout) {
  const struct {
    int timeout, interval;
  } cases[] = {{120, 30}, {61, 30}, {60, 30}, {59, 29}, {10, 5},       {4, 2},      {3, 1},
               {2, 1},    {1, 1},   {0, 1},   {-5, 1},  {INT_MAX, 30}, {INT_MIN, 1}};
  for (const auto& c : cases) EXPECT_EQ(keep_alive_interval(c.timeout), c.interval) << c.timeout;
}

TEST(KeepAliveDue, IsDueFirstAndThenAfterTheInterval) {
  EXPECT_TRUE(keep_alive_due(1000, 0, 30));
  EXPECT_FALSE(keep_alive_due(1000, 1000, 30));
  EXPECT_FALSE(keep_alive_due(1029, 1000, 30));
  EXPECT_TRUE(keep_alive_due(1030, 1000, 30));
}

TEST(KeepAliveDue, IsDueAtOnceAfterATimeInTheFuture) { EXPECT_TRUE(keep_alive_due(1000, 1001, 30)); }

}  // namespace
}  // namespace vexa

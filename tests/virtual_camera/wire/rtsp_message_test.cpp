// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/wire/rtsp_message.h"

#include <gtest/gtest.h>

#include <string>

#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/server/session_description.h"

namespace vexa::camera {
namespace {

TEST(RtspMessage, ARequestEndsAfterItsBodyAndTheEmptyLinesThatFollow) {
  const std::string head = "TEARDOWN rtsp://h/a RTSP/1.0\r\nCSeq: 5\r\n";
  const struct {
    std::string received;
    std::size_t size;
  } cases[] = {{head, 0},
               {head + "\r\n", head.size() + 2},
               {head + "\r\n\r\n", head.size() + 4},
               {head + "\r\n\r", head.size() + 2},
               {head + "\r\nPLAY", head.size() + 2},
               {head + "Content-Length: 3\r\n\r\nab", 0},
               {head + "Content-Length: 3\r\n\r\nabcd", head.size() + 24},
               {head + "Content-Length: x\r\n\r\nabcd", 0},
               {head + "Content-Length: 99999999999\r\n\r\nabcd", 0},
               {"garbage\r\n\r\nmore", 11}};
  for (const auto& c : cases) EXPECT_EQ(rtsp_request_size(c.received), c.size) << c.received;
}

TEST(RtspMessage, SequenceAndSessionAreDecimalNumbers) {
  const struct {
    std::string text;
    std::optional<std::uint32_t> sequence;
    std::uint32_t session;
  } cases[] = {{"1", 1U, 1},
               {"12345678;timeout=60", std::nullopt, 12345678},
               {"", std::nullopt, 0},
               {"-1", std::nullopt, 0},
               {"ABC", std::nullopt, 0},
               {"4294967296", std::nullopt, 0},
               {"4294967295", 4294967295U, 4294967295U}};
  for (const auto& c : cases) {
    RequestHead head;
    head.fields = {{"CSeq", c.text}, {"Session", c.text}};
    EXPECT_EQ(sequence_of(head), c.sequence) << c.text;
    EXPECT_EQ(session_of(head), c.session) << c.text;
  }
}

TEST(RtspMessage, TheFirstTransportThatCanBeServedCounts) {
  using Kind = AskedTransport::Kind;
  const struct {
    std::string transport;
    Kind kind;
    int first, second;
  } cases[] = {{"RTP/AVP;unicast;client_port=5000-5001", Kind::kUdp, 5000, 5001},
               {"RTP/AVP/UDP;unicast;client_port=5000-5003", Kind::kUdp, 5000, 5003},
               {"RTP/AVP;client_port=5000", Kind::kUdp, 5000, 5001},
               {"RTP/AVP;client_port=5000;mode=play-1", Kind::kUdp, 5000, 5001},
               {"RTP/AVP;client_port=5000-x", Kind::kUdp, 5000, 5001},
               {"RTP/AVP/TCP;unicast;interleaved=0-1;", Kind::kInterleaved, 0, 1},
               {"RTP/AVP/TCP;unicast;interleaved=4-7", Kind::kInterleaved, 4, 7},
               {"RTP/AVP/TCP;interleaved=254", Kind::kInterleaved, 254, 255},
               {"RTP/AVP/TCP;unicast", Kind::kInterleaved, 0, 1},
               {"RTP/AVP/TCP", Kind::kInterleaved, 0, 1},
               {"RTP/AVP/TCP;unicast;interleaved=0-1,RTP/AVP;unicast;client_port=7000-7001", Kind::kInterleaved, 0, 1},
               {"RTP/AVP;multicast,RTP/AVP;unicast;client_port=7000-7001", Kind::kUdp, 7000, 7001},
               {"RTP/AVP;unicast;client_port=0-1,RTP/AVP/TCP;interleaved=2-3", Kind::kInterleaved, 2, 3},
               {"RTP/AVP/TCP;interleaved=255", Kind::kNone, 0, 0},
               {"RTP/AVP/TCP;interleaved=0-256", Kind::kNone, 0, 0},
               {"RTP/AVP/TCP;interleaved=70000", Kind::kNone, 0, 0},
               {"RTP/AVP/TCP;interleaved=x", Kind::kNone, 0, 0},
               {"RTP/AVP/TCPX;interleaved=0-1", Kind::kNone, 0, 0},
               {"RTP/AVP;multicast;client_port=5000-5001", Kind::kNone, 0, 0},
               {"RTP/AVP;unicast;client_port=70000-70001", Kind::kNone, 0, 0},
               {"RTP/AVP;unicast;client_port=x", Kind::kNone, 0, 0},
               {"RTP/AVP;unicast", Kind::kNone, 0, 0},
               {"client_port=5000", Kind::kNone, 0, 0},
               {"", Kind::kNone, 0, 0}};
  for (const auto& c : cases) {
    const AskedTransport asked = asked_transport(c.transport);
    EXPECT_EQ(asked.kind, c.kind) << c.transport;
    EXPECT_EQ(asked.first, c.first) << c.transport;
    EXPECT_EQ(asked.second, c.second) << c.transport;
  }
}

TEST(RtspMessage, PacketsBeforeARequestAreKnownOnceTheyAreWhole) {
  const std::string packet("$\1\0\3abc", 7);
  const std::string empty("$\1\0\0", 4);
  const struct {
    std::string received;
    std::size_t size;
  } cases[] = {{"", 0},
               {"TEARDOWN", 0},
               {packet.substr(0, 3), 0},
               {packet.substr(0, 6), 0},
               {packet, 7},
               {packet + "TEARDOWN", 7},
               {empty + packet + "$", 11},
               {std::string("$\0\1\0", 4) + std::string(255, 'x'), 0},
               {std::string("$\0\1\0", 4) + std::string(256, 'x'), 260}};
  for (const auto& c : cases) EXPECT_EQ(leading_packets_size(c.received), c.size) << c.received;
}

TEST(RtspMessage, UrlsNameAStreamOrItsTrack) {
  const struct {
    std::string path;
    VideoUrl url;
  } cases[] = {{"/media/video1", VideoUrl::kStream},
               {"/media/video12/", VideoUrl::kStream},
               {"/media/video1/video", VideoUrl::kTrack},
               {"/media/video", VideoUrl::kNone},
               {"/media/videoX", VideoUrl::kNone},
               {"/media/video1/audio", VideoUrl::kNone},
               {"/media/video1/video/x", VideoUrl::kNone},
               {"", VideoUrl::kNone},
               {"/video1", VideoUrl::kNone}};
  for (const auto& c : cases) EXPECT_EQ(classify_url(c.path), c.url) << c.path;
}

TEST(RtspMessage, AnswersHoldStatusSequenceFieldsAndBody) {
  EXPECT_EQ(rtsp_answer({"200 OK", 3, "Session: 1\r\n", {}}).bytes, "RTSP/1.0 200 OK\r\nCSeq: 3\r\nSession: 1\r\n\r\n");
  EXPECT_EQ(rtsp_answer({"400 Bad Request", std::nullopt, {}, {}}).bytes, "RTSP/1.0 400 Bad Request\r\n\r\n");
  const Answer answer = rtsp_answer({"200 OK", 1, {}, "v=0\r\n"});
  EXPECT_EQ(answer.bytes,
            "RTSP/1.0 200 OK\r\nCSeq: 1\r\nContent-Type: application/sdp\r\nContent-Length: 5\r\n\r\nv=0\r\n");
  EXPECT_EQ(answer.status, 200);
}

TEST(SessionDescription, NamesThePayloadTheClockAndTheTrack) {
  CameraOptions options;
  EXPECT_EQ(describe_session(options, {}, 500),
            "v=0\r\no=- 1 1 IN IP4 127.0.0.2\r\ns=video\r\nt=0 0\r\nm=video 0 RTP/AVP 96\r\n"
            "a=rtpmap:96 H264/90000\r\na=fmtp:96 packetization-mode=1\r\na=control:video\r\n");
  options.range_clock = "20240131T235959.250Z";
  options.payload_type = 97;
  options.clock_rate = 48000;
  EXPECT_EQ(describe_session(options, {}, 500),
            "v=0\r\no=- 1 1 IN IP4 127.0.0.2\r\ns=video\r\nt=0 0\r\na=range:clock=20240131T235959.250Z\r\n"
            "m=video 0 RTP/AVP 97\r\na=rtpmap:97 H264/48000\r\na=fmtp:97 packetization-mode=1\r\na=control:video\r\n");
}

TEST(SessionDescription, ParameterSetsAreNamedWhereTheyFit) {
  const std::string bytes("\0\0\1\x67\x42\xC0\x1E\x55\0\0\1\x68\xCE\0\0\1\x65\x88", 18);
  const SourceFormat format = source_format(Codec::kH264, bytes, 25);
  CameraOptions options;
  const std::string sets = ";profile-level-id=42c01e;sprop-parameter-sets=Z0LAHlU=,aM4=\r\n";
  const std::string whole = describe_session(options, format, 500);
  EXPECT_NE(whole.find(sets), std::string::npos);
  EXPECT_EQ(describe_session(options, format, whole.size()), whole);
  EXPECT_EQ(describe_session(options, format, whole.size() - 1).find("sprop"), std::string::npos);
}

TEST(RtspMessage, RecordingsAreNamedAfterMediaWhereNoVideoStreamIs) {
  const struct {
    const char* path;
    VideoUrl kind;
    const char* name;
  } rows[] = {{"/media/rec1", VideoUrl::kStream, "rec1"},
              {"/media/rec1/video", VideoUrl::kTrack, "rec1"},
              {"/media/video", VideoUrl::kStream, "video"},
              {"/media/videos/video", VideoUrl::kTrack, "videos"},
              {"/media/video1", VideoUrl::kNone, ""},
              {"/media/video1/video", VideoUrl::kNone, ""},
              {"/media/rec1/audio", VideoUrl::kNone, ""},
              {"/media//video", VideoUrl::kNone, ""},
              {"/media/", VideoUrl::kNone, ""},
              {"/medium/rec1", VideoUrl::kNone, ""},
              {"", VideoUrl::kNone, ""}};
  for (const auto& row : rows) {
    EXPECT_EQ(recording_url(row.path).kind, row.kind) << row.path;
    EXPECT_EQ(recording_url(row.path).name, row.name) << row.path;
  }
}

TEST(RtspMessage, ScaleIsReadAsAnIntegerAndIs1WithoutOne) {
  const struct {
    const char* field;
    int scale;
  } rows[] = {{"Scale: 4\r\n", 4},           {"scale: -1\r\n", -1}, {"", 1}, {"Scale: 0\r\n", 1}, {"Scale: x\r\n", 1},
              {"Scale: 99999999999\r\n", 1}, {"Scale: 2.5\r\n", 2}};
  for (const auto& row : rows) {
    const auto head = parse_head(std::string("PLAY rtsp://a/media/b RTSP/1.0\r\n") + row.field + "\r\n");
    ASSERT_TRUE(head);
    EXPECT_EQ(scale_of(*head), row.scale) << row.field;
  }
}

}  // namespace
}  // namespace vexa::camera

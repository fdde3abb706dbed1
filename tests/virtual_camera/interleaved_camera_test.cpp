// Pictures from the camera inside the RTSP connection.
#include <gtest/gtest.h>

#include <algorithm>
#include <optional>
#include <set>
#include <span>
#include <string>
#include <vector>

#include "tests/virtual_camera/camera_client.h"
#include "tests/virtual_camera/depacketiser.h"
#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

constexpr int kFirstSession = 12345678;

CameraOptions interleaved_options() {
  CameraOptions options = test_options();
  options.clip_path = std::string(VEXA_CLIPS) + "/small.h264";
  options.speed = 20;
  options.interleaved_pause = milliseconds(0);
  return options;
}

// A host that takes packets and answers apart as they come.
struct SharedConnection {
  struct Packet {
    int channel = 0;
    std::vector<std::uint8_t> bytes;
  };

  explicit SharedConnection(const VirtualCamera& camera) : rtsp(camera.address(), camera.rtsp_port()) {}

  bool fill(std::size_t size) {
    while (received.size() < size) {
      const std::string piece = rtsp.read_once();
      if (piece.empty()) return false;
      received += piece;
    }
    return true;
  }
  std::string cut(std::size_t size) {
    std::string front = received.substr(0, size);
    received.erase(0, size);
    return front;
  }
  // What stands next on the connection: a packet, put behind the others, or an answer, which is returned.
  std::optional<std::string> take() {
    if (!fill(4)) return "ended";
    if (received[0] != '$') {
      while (received.find("\r\n\r\n") == std::string::npos) {
        if (!fill(received.size() + 1)) return "cut";
      }
      return cut(received.find("\r\n\r\n") + 4);
    }
    const std::string prefix = cut(4);
    const auto size =
        static_cast<std::size_t>(static_cast<unsigned char>(prefix[2]) << 8U | static_cast<unsigned char>(prefix[3]));
    if (!fill(size)) return "cut";
    const std::string bytes = cut(size);
    packets.push_back({prefix[1], {bytes.begin(), bytes.end()}});
    return std::nullopt;
  }
  std::string take_answer() {
    while (true) {
      if (auto answer = take()) return *answer;
    }
  }
  void take_packets(std::size_t count) {
    while (packets.size() < count) ASSERT_EQ(take(), std::nullopt);
  }
  std::string ask(const std::string& request) {
    rtsp.send(request);
    return take_answer();
  }

  Client rtsp;
  std::string received;
  std::vector<Packet> packets;
};

// A teardown takes away what still waits; all before it has come, in order.
void expect_those_that_left(const SharedConnection& host, VirtualCamera& camera) {
  std::vector<SentPacket> sent = camera.sent().snapshot();
  std::erase_if(sent, [](const SentPacket& packet) { return packet.lost; });
  ASSERT_LE(host.packets.size(), sent.size());
  for (std::size_t i = 0; i < host.packets.size(); ++i) {
    EXPECT_EQ(host.packets[i].bytes[2] << 8U | host.packets[i].bytes[3], sent[i].sequence) << i;
  }
}

TEST(InterleavedCamera, SendsWhatItSendsInDatagrams) {
  CameraOptions options = interleaved_options();
  options.pictures = 260;
  StartedCamera camera(options);
  SharedConnection host(camera);
  EXPECT_EQ(host.ask(kAsk.setup_interleaved(1)),
            "RTSP/1.0 200 OK\r\nCSeq: 1\r\nSession: 12345678;timeout=60\r\n"
            "Transport: RTP/AVP/TCP;unicast;interleaved=0-1\r\n\r\n");
  EXPECT_EQ(host.ask(kAsk.play(2, kFirstSession)).substr(0, 15), "RTSP/1.0 200 OK");
  const auto& pictures = camera.clip()->pictures();
  std::size_t packets = 0;
  for (std::size_t i = 0; i < 260; ++i) packets += pictures[i % pictures.size()].packets();
  host.take_packets(packets);
  ASSERT_TRUE(camera.sent().wait_for_finished(1, milliseconds(kPatience)));
  const std::vector<SentPacket> sent = camera.sent().snapshot();
  ASSERT_EQ(sent.size(), packets);
  Depacketiser receiver;
  for (std::size_t i = 0; i < sent.size(); ++i) {
    const std::vector<std::uint8_t>& packet = host.packets[i].bytes;
    EXPECT_EQ(host.packets[i].channel, 0);
    EXPECT_EQ(packet.size(), sent[i].size);
    EXPECT_EQ(packet[2] << 8U | packet[3], static_cast<int>(i) + 1);
    receiver.add(std::span(packet).subspan(12));
    if ((packet[1] & 0x80U) == 0) continue;
    const auto& units = camera.clip()->clip().access_units();
    EXPECT_TRUE(receiver.take() == units[static_cast<std::size_t>(sent[i].picture % units.size())].as_delivered())
        << sent[i].picture;
  }
  EXPECT_EQ(sent.back().picture, 259U);
}

TEST(InterleavedCamera, AnswersAndPacketsNeverTearEachOther) {
  CameraOptions options = interleaved_options();
  options.speed = 100;
  options.request_faults.push_back(RequestFault::byte_at_a_time("CSeq: 7\r\n", milliseconds(1)));
  StartedCamera camera(options);
  SharedConnection host(camera);
  host.ask(kAsk.setup_interleaved(1));
  host.ask(kAsk.play(2, kFirstSession));
  for (int i = 3; i < 40; ++i) {
    EXPECT_EQ(host.ask(kAsk.get_parameter(i, kFirstSession)),
              fmt::format("RTSP/1.0 200 OK\r\nCSeq: {}\r\nSession: 12345678\r\n\r\n", i));
  }
  EXPECT_EQ(host.ask(kAsk.teardown(40, kFirstSession)), "RTSP/1.0 200 OK\r\nCSeq: 40\r\n\r\n");
  EXPECT_GT(host.packets.size(), 0U);
  expect_those_that_left(host, camera);
}

TEST(InterleavedCamera, AHostsReportsBetweenItsRequestsArePassedOver) {
  StartedCamera camera(interleaved_options());
  SharedConnection host(camera);
  host.ask(kAsk.setup_interleaved(1));
  const std::string report = std::string("$\1\0\x8", 4) + "12\r\n\r\n34";
  host.rtsp.send(report + report.substr(0, 6));
  host.rtsp.send(report.substr(6) + kAsk.get_parameter(2, kFirstSession) + report);
  EXPECT_EQ(host.take_answer(), "RTSP/1.0 200 OK\r\nCSeq: 2\r\nSession: 12345678\r\n\r\n");
  EXPECT_EQ(host.ask(kAsk.teardown(3, kFirstSession)), "RTSP/1.0 200 OK\r\nCSeq: 3\r\n\r\n");
  EXPECT_EQ(camera.journal().count("$"), 0U);
}

TEST(InterleavedCamera, EachSessionOfAConnectionHasChannelsOfItsOwn) {
  CameraOptions options = interleaved_options();
  options.pictures = 5;
  StartedCamera camera(options);
  SharedConnection host(camera);
  host.ask(kAsk.setup_interleaved(1));
  EXPECT_NE(host.ask(kAsk.setup_interleaved(2)).find(";interleaved=2-3\r\n"), std::string::npos);
  host.ask(kAsk.play(3, kFirstSession));
  host.ask(kAsk.play(4, kFirstSession + 1));
  ASSERT_TRUE(camera.sent().wait_for_finished(2, milliseconds(kPatience)));
  host.take_packets(static_cast<std::size_t>(camera.sent().sent()));
  std::set<int> channels;
  for (const auto& packet : host.packets) channels.insert(packet.channel);
  EXPECT_EQ(channels, (std::set<int>{0, 2}));
}

TEST(InterleavedCamera, TeardownEndsThePacketsAndLeavesTheConnection) {
  StartedCamera camera(interleaved_options());
  SharedConnection host(camera);
  host.ask(kAsk.setup_interleaved(1));
  host.ask(kAsk.play(2, kFirstSession));
  host.take_packets(10);
  EXPECT_EQ(host.ask(kAsk.teardown(3, kFirstSession)), "RTSP/1.0 200 OK\r\nCSeq: 3\r\n\r\n");
  const std::size_t taken = host.packets.size();
  EXPECT_EQ(host.ask("OPTIONS * RTSP/1.0\r\nCSeq: 4\r\n\r\n").substr(0, 15), "RTSP/1.0 200 OK");
  EXPECT_EQ(host.packets.size(), taken);
  EXPECT_EQ(camera.sessions(), 0U);
}

// What a host does not read must not pile up: packets are skipped, the rest of their pictures too, until it reads on.
TEST(InterleavedCamera, SkipsPacketsOfAHostThatDoesNotRead) {
  CameraOptions options = interleaved_options();
  options.speed = 10000;
  options.burst_gap = std::chrono::microseconds(0);
  StartedCamera camera(options);
  SharedConnection host(camera);
  host.ask(kAsk.setup_interleaved(1));
  host.ask(kAsk.play(2, kFirstSession));
  const auto some_lost = [](const std::deque<SentPacket>& packets) {
    return std::any_of(packets.begin(), packets.end(), [](const SentPacket& packet) { return packet.lost; });
  };
  ASSERT_TRUE(camera.sent().wait_for(some_lost, milliseconds(kPatience)));
  EXPECT_EQ(host.ask(kAsk.teardown(3, kFirstSession)), "RTSP/1.0 200 OK\r\nCSeq: 3\r\n\r\n");
  std::optional<std::uint64_t> cut;
  for (const SentPacket& packet : camera.sent().snapshot()) {
    EXPECT_TRUE(packet.lost || packet.picture != cut) << packet.picture;
    if (packet.lost) cut = packet.picture;
  }
  expect_those_that_left(host, camera);
}

TEST(InterleavedCamera, GivesUpAHostThatNeverReads) {
  CameraOptions options = interleaved_options();
  options.speed = 10000;
  options.burst_gap = std::chrono::microseconds(0);
  options.interleaved_patience = milliseconds(50);
  StartedCamera camera(options);
  Client host(camera.address(), camera.rtsp_port());
  host.ask(kAsk.setup_interleaved(1));
  host.send(kAsk.play(2, kFirstSession));
  EXPECT_TRUE(host.reset_unread());
  EXPECT_EQ(camera.sessions(), 0U);
}

TEST(InterleavedCamera, BeginsAWhileAfterTheAnswerToPlay) {
  CameraOptions options = interleaved_options();
  options.interleaved_pause = milliseconds(120);
  StartedCamera camera(options);
  SharedConnection host(camera);
  host.ask(kAsk.setup_interleaved(1));
  host.ask(kAsk.play(2, kFirstSession));
  const auto answered = camera.journal().snapshot().back().time;
  // The steady clock is read first: a break between the two readings makes the answer seem older, never younger.
  const auto now = std::chrono::steady_clock::now();
  const auto steady = now - (std::chrono::system_clock::now() - answered);
  const auto any = [](const std::deque<SentPacket>& packets) { return !packets.empty(); };
  ASSERT_TRUE(camera.sent().wait_for(any, milliseconds(kPatience)));
  EXPECT_GE(camera.sent().snapshot().front().time - steady, milliseconds(115));
}

}  // namespace
}  // namespace vexa::camera

// Pictures from the camera to a UDP socket.
#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "tests/virtual_camera/camera_client.h"
#include "tests/virtual_camera/depacketiser.h"
#include "virtual_camera/camera_host.h"
#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {
namespace {

using Buffer = std::vector<std::uint8_t>;
using std::chrono::milliseconds;

CameraOptions streaming_options(const std::string& clip) {
  CameraOptions options = test_options();
  options.clip_path = std::string(VEXA_CLIPS) + "/" + clip + ".h264";
  options.speed = 20;
  return options;
}

std::uint64_t fnv1a(const Buffer& bytes) {
  std::uint64_t hash = 14695981039346656037ULL;
  for (const std::uint8_t byte : bytes) hash = (hash ^ byte) * 1099511628211ULL;
  return hash;
}

std::uint32_t session_number(const std::string& setup_answer) {
  return static_cast<std::uint32_t>(std::stoul(setup_answer.substr(setup_answer.find("Session: ") + 9)));
}

// A host's side of one stream.
struct Player {
  explicit Player(VirtualCamera& camera) : rtsp(camera.address(), camera.rtsp_port()) {
    session = session_number(rtsp.ask(kAsk.setup(1, udp.port())));
    EXPECT_EQ(rtsp.ask(kAsk.play(2, session)).substr(0, 15), "RTSP/1.0 200 OK");
  }

  // Datagrams until this many have come, or none comes any more.
  std::vector<Buffer> take(std::size_t count, int patience = kPatience) {
    std::vector<Buffer> datagrams;
    while (datagrams.size() < count) {
      Buffer datagram = udp.receive(patience);
      if (datagram.empty()) break;
      datagrams.push_back(std::move(datagram));
    }
    return datagrams;
  }

  // All datagrams of a stream that ends.
  std::vector<Buffer> take_all(const SentLog& log) {
    std::vector<Buffer> datagrams;
    while (true) {
      const bool finished = log.finished_streams() > 0;
      Buffer datagram = udp.receive(20);
      if (datagram.empty() && finished) return datagrams;
      if (!datagram.empty()) datagrams.push_back(std::move(datagram));
    }
  }

  UdpReceiver udp;
  Client rtsp;
  std::uint32_t session = 0;
};

// The pictures of datagrams that all came in order.
std::vector<Buffer> pictures_of(const std::vector<Buffer>& datagrams) {
  std::vector<Buffer> pictures;
  Depacketiser receiver;
  for (const Buffer& datagram : datagrams) {
    receiver.add(std::span(datagram).subspan(12));
    if ((datagram[1] & 0x80U) != 0) pictures.push_back(receiver.take());
  }
  return pictures;
}

void expect_clip_pictures(const std::vector<Buffer>& pictures, const Clip& clip) {
  for (std::size_t i = 0; i < pictures.size(); ++i) {
    const AccessUnit& unit = clip.access_units()[i % clip.access_units().size()];
    EXPECT_TRUE(pictures[i] == unit.as_delivered()) << "picture " << i;
  }
}

TEST(RtpCamera, PicturesArriveAsTheClipHoldsThemAndTheClipStartsOver) {
  for (const char* clip : {"small", "slices"}) {
    CameraOptions options = streaming_options(clip);
    options.pictures = 260;
    StartedCamera camera(options);
    Player player(camera);
    std::size_t packets = 0;
    for (std::size_t i = 0; i < 260; ++i) packets += camera.clip()->pictures()[i % 250].packets();
    const std::vector<Buffer> pictures = pictures_of(player.take(packets));
    ASSERT_EQ(pictures.size(), 260U);
    expect_clip_pictures(pictures, camera.clip()->clip());
    EXPECT_TRUE(camera.sent().wait_for_finished(1, milliseconds(kPatience)));
  }
}

TEST(RtpCamera, TheSentLogIsWhatArrived) {
  CameraOptions options = streaming_options("small");
  options.pictures = 100;
  options.packet_faults.loss = 0.05;
  options.packet_faults.reorder = 0.05;
  options.packet_faults.duplicate = 0.02;
  options.packet_faults.delay = 0.02;
  options.packet_faults.delay_time = milliseconds(30);
  options.packet_faults.corrupt_payload = 0.02;
  options.packet_faults.corrupt_header = 0.02;
  StartedCamera camera(options);
  Player player(camera);
  const std::vector<Buffer> datagrams = player.take_all(camera.sent());
  std::vector<SentPacket> sent = camera.sent().snapshot();
  EXPECT_GT(std::erase_if(sent, [](const SentPacket& packet) { return packet.lost; }), 0U);
  EXPECT_EQ(sent.size(), camera.sent().sent());
  ASSERT_EQ(datagrams.size(), sent.size());
  for (std::size_t i = 0; i < sent.size(); ++i) {
    EXPECT_EQ(fnv1a(datagrams[i]), sent[i].hash) << i;
    EXPECT_EQ(datagrams[i].size(), sent[i].size) << i;
    EXPECT_EQ(datagrams[i][2] << 8U | datagrams[i][3], sent[i].sequence) << i;
    EXPECT_EQ((datagrams[i][1] & 0x80U) != 0, sent[i].marker) << i;
    EXPECT_EQ(sent[i].session, player.session);
  }
}

TEST(RtpCamera, TheSameSeedSendsTheSameRun) {
  const auto run = [] {
    CameraOptions options = streaming_options("small");
    options.pictures = 80;
    options.seed = 5;
    options.packet_faults.loss = 0.05;
    options.packet_faults.reorder = 0.1;
    options.packet_faults.delay = 0.05;
    VirtualCamera camera(options);
    EXPECT_TRUE(camera.start()) << camera.error();
    const Player player(camera);
    EXPECT_TRUE(camera.sent().wait_for_finished(1, milliseconds(kPatience)));
    std::vector<std::uint64_t> hashes;
    for (const SentPacket& packet : camera.sent().snapshot()) hashes.push_back(packet.lost ? 0 : packet.hash);
    return hashes;
  };
  const std::vector<std::uint64_t> first = run();
  EXPECT_GT(first.size(), 100U);
  EXPECT_EQ(first, run());
}

TEST(RtpCamera, PacketFaultsSetLaterHoldForTheNextStream) {
  CameraOptions options = streaming_options("small");
  options.pictures = 10;
  StartedCamera camera(options);
  PacketFaults faults;
  faults.loss = 1;
  camera.set_packet_faults(faults);
  Player player(camera);
  ASSERT_TRUE(camera.sent().wait_for_finished(1, milliseconds(kPatience)));
  EXPECT_EQ(camera.sent().sent(), 0U);
  EXPECT_GT(camera.sent().snapshot().size(), 9U);
}

TEST(RtpCamera, PicturesFarApartInTimeKeepTheirTimestamps) {
  CameraOptions options = streaming_options("small");
  options.pictures = 5;
  options.start_timestamp = 4294967295U - 3599;
  StartedCamera camera(options);
  const Player player(camera);
  ASSERT_TRUE(camera.sent().wait_for_finished(1, milliseconds(kPatience)));
  for (const SentPacket& packet : camera.sent().snapshot()) {
    EXPECT_EQ(packet.timestamp, static_cast<std::uint32_t>(4294963696U + 3600 * packet.picture));
  }
}

TEST(RtpCamera, LargePicturesLeaveInBurstsOfTheSetSize) {
  CameraOptions options = streaming_options("hd");
  options.pictures = 10;
  options.burst_packets = 8;
  StartedCamera camera(options);
  const Player player(camera);
  ASSERT_TRUE(camera.sent().wait_for_finished(1, milliseconds(kPatience)));
  const std::vector<SentPacket> sent = camera.sent().snapshot();
  EXPECT_GT(sent.size(), 200U);
  std::size_t burst = 0;
  for (std::size_t i = 0; i < sent.size(); ++i) {
    burst = i > 0 && sent[i].time == sent[i - 1].time ? burst + 1 : 1;
    EXPECT_LE(burst, 8U);
  }
}

TEST(RtpCamera, SeveralClientsGetStreamsOfTheirOwn) {
  CameraOptions options = streaming_options("small");
  options.pictures = 50;
  StartedCamera camera(options);
  std::vector<std::unique_ptr<Player>> players;
  for (int i = 0; i < 4; ++i) players.push_back(std::make_unique<Player>(camera));
  std::size_t packets = 0;
  for (std::size_t i = 0; i < 50; ++i) packets += camera.clip()->pictures()[i].packets();
  for (const auto& player : players) {
    const std::vector<Buffer> pictures = pictures_of(player->take(packets));
    ASSERT_EQ(pictures.size(), 50U);
    expect_clip_pictures(pictures, camera.clip()->clip());
  }
}

TEST(RtpCamera, TeardownEndsTheStream) {
  StartedCamera camera(streaming_options("small"));
  Player player(camera);
  EXPECT_EQ(player.take(20).size(), 20U);
  EXPECT_EQ(player.rtsp.ask(kAsk.teardown(3, player.session)), "RTSP/1.0 200 OK\r\nCSeq: 3\r\n\r\n");
  EXPECT_EQ(camera.sessions(), 0U);
  const std::uint64_t sent = camera.sent().sent();
  EXPECT_LT(player.take(100000, 200).size(), 100000U);
  EXPECT_EQ(camera.sent().sent(), sent);
}

TEST(RtpCamera, AClientWhosePortIsClosedDisturbsNoOther) {
  CameraOptions options = streaming_options("small");
  options.pictures = 50;
  StartedCamera camera(options);
  // Held, so that nobody else is given the port, by a socket that hears another peer alone.
  asio::io_context context;
  const auto loopback = asio::ip::make_address("127.0.0.1");
  asio::ip::udp::socket closed(context, asio::ip::udp::endpoint(loopback, 0));
  closed.connect(asio::ip::udp::endpoint(loopback, 9));
  Client rtsp(camera.address(), camera.rtsp_port());
  const std::uint32_t session = session_number(rtsp.ask(kAsk.setup(1, closed.local_endpoint().port())));
  rtsp.ask(kAsk.play(2, session));
  Player player(camera);
  EXPECT_TRUE(camera.sent().wait_for_finished(2, milliseconds(kPatience)));
  std::size_t arrived = 0;
  for (const SentPacket& packet : camera.sent().snapshot()) arrived += packet.session == player.session ? 1 : 0;
  EXPECT_EQ(player.take(arrived + 1, 200).size(), arrived);
}

TEST(CameraHost, CamerasAtConsecutiveAddressesStreamOnSharedThreads) {
  CameraOptions options = streaming_options("small");
  options.pictures = 30;
  CameraHost host(options, 8, 2);
  ASSERT_TRUE(host.start()) << host.error();
  ASSERT_EQ(host.size(), 8U);
  std::vector<std::unique_ptr<Player>> players;
  for (std::size_t i = 0; i < 8; ++i) {
    EXPECT_EQ(host.camera(i).address(), address_after(options.address, i));
    EXPECT_EQ(host.camera(i).clip(), host.camera(0).clip());
    EXPECT_EQ(host.camera(i).settings().get("system", "Serial"), fmt::format("{}", 100001 + i));
    EXPECT_EQ(host.camera(i).settings().get("network", "MacAddress"), fmt::format("02:00:00:00:00:{:02x}", i + 1));
    players.push_back(std::make_unique<Player>(host.camera(i)));
  }
  std::size_t packets = 0;
  for (std::size_t i = 0; i < 30; ++i) packets += host.camera(0).clip()->pictures()[i].packets();
  for (const auto& player : players) {
    expect_clip_pictures(pictures_of(player->take(packets)), host.camera(0).clip()->clip());
  }
  host.stop();
  for (std::size_t i = 0; i < 8; ++i) EXPECT_EQ(host.camera(i).sessions(), 0U);
}

TEST(CameraHost, StartsAllCamerasOrNone) {
  VirtualCamera taken([] {
    CameraOptions options = test_options();
    options.address = address_after(options.address, 2);
    return options;
  }());
  ASSERT_TRUE(taken.start()) << taken.error();
  CameraOptions options = test_options();
  options.http_port = taken.http_port();
  CameraHost host(options, 3);
  EXPECT_FALSE(host.start());
  EXPECT_NE(host.error().find(taken.address()), std::string::npos);
  EXPECT_FALSE(Client(host.camera(0).address(), options.http_port).connected());
}

TEST(CameraHost, AddressesCountAsNumbers) {
  const struct {
    const char* start;
    std::size_t steps;
    const char* address;
  } cases[] = {{"127.0.0.2", 0, "127.0.0.2"},
               {"127.0.0.2", 1, "127.0.0.3"},
               {"127.0.0.255", 1, "127.0.1.0"},
               {"255.255.255.255", 1, ""},
               {"nowhere", 1, ""},
               {"", 0, ""},
               {"255.255.255.254", 1, "255.255.255.255"}};
  for (const auto& c : cases) EXPECT_EQ(address_after(c.start, c.steps), c.address) << c.start;
}

}  // namespace
}  // namespace vexa::camera

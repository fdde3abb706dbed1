// SPDX-License-Identifier: Apache-2.0
// A camera that records while its network is away, over real connections.
#include <gtest/gtest.h>

#include <chrono>
#include <span>
#include <string>
#include <vector>

#include "tests/support/process_state.h"
#include "tests/virtual_camera/camera_client.h"
#include "tests/virtual_camera/depacketiser.h"
#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {
namespace {

constexpr const char* kStorageOn =
    "/command/edgestorage.cgi?Edgestorage=on&EsRec1=image1,off&EsAlmRec1Time=0,0&EsAlmRec1WatchAddress=10.0.0.1";

CameraOptions card_options() {
  CameraOptions options = test_options();
  options.clip_path = VEXA_CLIPS "/small.h264";
  options.card_bytes = 1 << 20;
  options.speed = 20;
  options.control = true;
  return options;
}

class CardCamera : public testing::Test {
 protected:
  explicit CardCamera(CameraOptions options = card_options()) : camera_(std::move(options)) {}
  void SetUp() override { ASSERT_TRUE(camera_.start()) << camera_.error(); }

  std::string get(const std::string& path) {
    Client client(camera_.address(), camera_.http_port());
    client.send(http_get(path));
    return client.read_to_end();
  }
  std::string control(const std::string& path) {
    Client client("127.0.0.1", camera_.control_port());
    return client.ask("GET " + path + " HTTP/1.0\r\n\r\n");
  }
  bool reachable() { return Client(camera_.address(), camera_.http_port()).connected(); }

  std::size_t pictures_stored() {
    const auto recordings = camera_.card().recordings();
    return !recordings || recordings->empty() ? 0 : recordings->back().pictures.size();
  }
  bool finished() {
    return vexa_test::eventually([this] {
      const auto recordings = camera_.card().recordings();
      return recordings && !recordings->empty() && recordings->back().finished;
    });
  }

  VirtualCamera camera_;
};

TEST_F(CardCamera, RecordsPictureByPictureWhileItsNetworkIsAway) {
  EXPECT_NE(get(kStorageOn).find(" 204 "), std::string::npos);
  camera_.unplug();
  EXPECT_FALSE(reachable());
  ASSERT_TRUE(vexa_test::eventually([this] { return pictures_stored() >= 30; }));
  camera_.plug();
  EXPECT_TRUE(reachable());
  ASSERT_TRUE(finished());
  const Recording recording = camera_.card().recordings()->front();
  for (std::size_t i = 0; i < recording.pictures.size(); ++i) {
    const std::size_t place = i % camera_.clip()->pictures().size();
    const auto expected = camera_.clip()->picture(place);
    ASSERT_EQ(*recording.pictures[i].bytes, expected) << i;
    EXPECT_EQ(recording.pictures[i].key, camera_.clip()->is_key(place)) << i;
    EXPECT_EQ(recording.pictures[i].at, std::chrono::milliseconds(40 * i)) << i;
  }
}

TEST_F(CardCamera, IsUnpluggedAndPluggedThroughItsControlPort) {
  get(kStorageOn);
  EXPECT_EQ(control("/network/unplug"), "HTTP/1.0 204 No Content\r\n\r\n");
  EXPECT_FALSE(reachable());
  ASSERT_TRUE(vexa_test::eventually([this] { return pictures_stored() > 0; }));
  EXPECT_EQ(control("/network/plug"), "HTTP/1.0 204 No Content\r\n\r\n");
  EXPECT_TRUE(reachable());
  EXPECT_EQ(control("/network/cut").substr(0, 12), "HTTP/1.0 404");
  ASSERT_TRUE(finished());
}

TEST_F(CardCamera, DoesNotRecordWhileStorageIsOff) {
  camera_.unplug();
  camera_.plug();
  get(kStorageOn);
  get("/command/edgestorage.cgi?Edgestorage=off");
  camera_.unplug();
  camera_.plug();
  EXPECT_TRUE(camera_.card().recordings()->empty());
}

TEST_F(CardCamera, ItsRecordingsHaveTheTimeThatItsClockShows) {
  get(kStorageOn);
  EXPECT_EQ(control("/clock/5"), "HTTP/1.0 204 No Content\r\n\r\n");
  for (const char* path : {"/clock/", "/clock/-1", "/clock/4102444801", "/clock/5s"}) {
    EXPECT_EQ(control(path).substr(0, 12), "HTTP/1.0 404") << path;
  }
  camera_.unplug();
  ASSERT_TRUE(vexa_test::eventually([this] { return pictures_stored() > 0; }));
  const auto start = camera_.card().recordings()->front().head.start;
  EXPECT_GE(start, std::chrono::seconds(5));
  EXPECT_LT(start, std::chrono::hours(1));
  camera_.plug();
}

TEST_F(CardCamera, RecordsOnForTheTimeSetAfterItsNetworkIsBack) {
  get("/command/edgestorage.cgi?Edgestorage=on&EsRec1=image1,off&EsAlmRec1Time=0,600&EsAlmRec1WatchAddress=a");
  camera_.unplug();
  ASSERT_TRUE(vexa_test::eventually([this] { return pictures_stored() > 0; }));
  camera_.plug();
  const std::size_t before = pictures_stored();
  ASSERT_TRUE(vexa_test::eventually([&] { return pictures_stored() > before; }));
  EXPECT_NE(get("/command/search?Order=oldest").find("Status=recording"), std::string::npos);
  get("/command/edgestorage.cgi?Edgestorage=off");
  ASSERT_TRUE(finished());
}

TEST_F(CardCamera, ReportsItsFreeSpaceAndItsRecordings) {
  EXPECT_NE(get("/command/inquiry.cgi?inq=a-slot").find("ASlot=Free space : 1024Kbyte"), std::string::npos);
  RecordingHead head;
  const std::string name = camera_.card().begin(head);
  ASSERT_TRUE(camera_.card().add({std::make_shared<const std::string>(2048, 'x'), true, {}}));
  camera_.card().finish();
  EXPECT_NE(get("/command/inquiry.cgi?inq=a-slot").find("ASlot=Free space : 1022Kbyte"), std::string::npos);
  EXPECT_NE(get("/command/search?Order=oldest").find("\r\n\r\nStreamName=" + name + ",Start="), std::string::npos);
  EXPECT_NE(get("/command/edgestorage.cgi?DeletebyName=" + name).find(" 204 "), std::string::npos);
  EXPECT_TRUE(get("/command/search?Order=oldest").ends_with("Content-Length: 0\r\n\r\n"));
}

TEST_F(CardCamera, EndsARecordingWhenTheCardIsFullOrFails) {
  get(kStorageOn);
  camera_.unplug();
  ASSERT_TRUE(vexa_test::eventually([this] { return pictures_stored() > 0; }));
  camera_.card().set_health(CardHealth::kFailing);
  ASSERT_TRUE(finished());
  camera_.card().set_health(CardHealth::kGood);
  camera_.card().erase_all();
  const auto room = static_cast<std::size_t>(camera_.card().free_bytes());
  ASSERT_FALSE(camera_.card().begin({}).empty());
  ASSERT_TRUE(camera_.card().add({std::make_shared<const std::string>(room, 'x'), true, {}}));
  camera_.plug();
  camera_.unplug();
  camera_.plug();
  EXPECT_EQ(camera_.card().recordings()->size(), 1U);
}

class CardPlayback : public CardCamera {
 protected:
  void SetUp() override {
    CardCamera::SetUp();
    RecordingHead head;
    head.start = std::chrono::seconds(1706745599) + std::chrono::milliseconds(250);
    ask_.url = "rtsp://camera:554/media/" + camera_.card().begin(head);
    for (std::size_t i = 0; i < kPictures; ++i) {
      const auto bytes = camera_.clip()->picture(i);
      const std::chrono::microseconds at(i * 33300);
      ASSERT_TRUE(camera_.card().add({std::make_shared<const std::string>(bytes), camera_.clip()->is_key(i), at}));
    }
    camera_.card().finish();
  }

  static constexpr std::size_t kPictures = 40;
  RtspRequests ask_;
};

TEST_F(CardPlayback, IsDescribedWithTheClockOfTheRecording) {
  Client client(camera_.address(), camera_.rtsp_port());
  const std::string answer = client.ask(ask_.describe(1));
  EXPECT_NE(answer.find("a=range:clock=20240131T235959.2500Z-20240201T000000.5487Z\r\n"), std::string::npos);
  EXPECT_NE(answer.find("a=rtpmap:96 H264/90000\r\n"), std::string::npos);
}

TEST_F(CardPlayback, SendsWhatWasStoredWithTheStoredTimes) {
  Client client(camera_.address(), camera_.rtsp_port());
  UdpReceiver receiver;
  client.ask(ask_.describe(1));
  client.ask(ask_.setup(2, receiver.port()));
  EXPECT_EQ(client.ask(ask_.play(3, 12345678)),
            "RTSP/1.0 200 OK\r\nCSeq: 3\r\nSession: 12345678\r\nScale: 1\r\nRange: npt=0.000-\r\n\r\n");
  Depacketiser depacketiser;
  for (std::size_t picture = 0; picture < kPictures;) {
    const std::vector<std::uint8_t> packet = receiver.receive();
    ASSERT_GE(packet.size(), 12U);
    depacketiser.add(std::span(packet).subspan(12));
    if ((packet[1] & 0x80U) == 0) continue;
    const std::vector<std::uint8_t> rebuilt = depacketiser.take();
    ASSERT_EQ(std::string(rebuilt.begin(), rebuilt.end()), camera_.clip()->picture(picture)) << picture;
    const std::uint32_t stamp = static_cast<std::uint32_t>(packet[4]) << 24U |
                                static_cast<std::uint32_t>(packet[5]) << 16U |
                                static_cast<std::uint32_t>(packet[6]) << 8U | packet[7];
    EXPECT_EQ(stamp, 100000000 + picture * 2997) << picture;
    ++picture;
  }
  EXPECT_TRUE(receiver.receive(20).empty());
}

TEST_F(CardPlayback, IsNotFoundOnceTheRecordingIsGone) {
  const std::string gone = "RTSP/1.0 404 Not Found\r\nCSeq: ";
  Client client(camera_.address(), camera_.rtsp_port());
  UdpReceiver receiver;
  client.ask(ask_.setup(1, receiver.port()));
  camera_.card().erase_all();
  EXPECT_EQ(client.ask(ask_.play(2, 12345678)), gone + "2\r\n\r\n");
  EXPECT_EQ(client.ask(ask_.describe(3)), gone + "3\r\n\r\n");
  EXPECT_EQ(client.ask(ask_.setup(4, receiver.port())), gone + "4\r\n\r\n");
}

}  // namespace
}  // namespace vexa::camera

// SPDX-License-Identifier: Apache-2.0
// A new driver object: its members, their first values, and what its end releases.
#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <malloc.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "runtime/base/sync.h"
#include "tests/support/process_state.h"
#include "tests/support/scripted_camera.h"
#include "vexa/runtime.h"
#include "vexa/vexa_common.h"

namespace vexa_test {
namespace {

/// A model class, as one outside the library: it sees the driver's members.
class Model : public CVexaCommon {
 public:
  struct Place {
    const char* name;
    const void* address;
  };

  std::vector<Place> places() const {
    return {
#define PLACE(member) {#member, &member}
        PLACE(m_FixedSystemInfo),     PLACE(m_FixedConnectionInfo), PLACE(m_FixedCameraInfo),  PLACE(m_FixedAudioInfo),
        PLACE(m_FixedPTZControlInfo), PLACE(m_CameraInfo),          PLACE(m_ResolutionFilter), PLACE(m_AudioInfo),
        PLACE(m_PTZControlInfo),      PLACE(m_IoBoxInfo),           PLACE(m_LatestErrorText),  PLACE(m_ContinuousPTZ),
        PLACE(m_ChannelId),           PLACE(m_ConnectionInfo),      PLACE(m_LatestErrorCode),  PLACE(m_InquirySizes),
        PLACE(m_CGILogger),           PLACE(m_CGILogPath),          PLACE(m_ConnectionLock),   PLACE(m_CGILogEnabled),
#undef PLACE
    };
  }

  std::vector<CSimpleLock*> locks() {
    return {&m_VideoStateLock, &m_FrameQueueLock, &m_CamPosLock,   &m_CameraInquiryLock,
            &m_AudioLock,      &m_IoStreamLock,   &m_MdStreamLock, &m_ConnectionLock};
  }

  using CVexaCommon::m_AudioInfo;
  using CVexaCommon::m_CameraInfo;
  using CVexaCommon::m_CameraType;
  using CVexaCommon::m_CGILogEnabled;
  using CVexaCommon::m_CGILogPath;
  using CVexaCommon::m_ChannelId;
  using CVexaCommon::m_ConnectionInfo;
  using CVexaCommon::m_ContinuousPTZ;
  using CVexaCommon::m_FixedAudioInfo;
  using CVexaCommon::m_FixedCameraInfo;
  using CVexaCommon::m_FixedCameraInfoAvailable;
  using CVexaCommon::m_FixedConnectionInfo;
  using CVexaCommon::m_FixedIoBoxInfoAvailable;
  using CVexaCommon::m_FixedPTZControlInfo;
  using CVexaCommon::m_FixedPTZControlInfoAvailable;
  using CVexaCommon::m_FixedSystemInfo;
  using CVexaCommon::m_InquirySizes;
  using CVexaCommon::m_IoBoxInfo;
  using CVexaCommon::m_LatestErrorCode;
  using CVexaCommon::m_LatestErrorText;
  using CVexaCommon::m_RtpPacketBuffer;
  using CVexaCommon::m_RtpPackets;
  using CVexaCommon::m_StagingBuffer;
  using CVexaCommon::m_StopVideoEvent;
  using CVexaCommon::m_StreamingThread;
  using CVexaCommon::m_UseMotionDetection;
  using CVexaCommon::m_ZoomRatios;
};

TEST(DriverObject, KeepsItsMembersInTheOrderThatModelClassesCountOn) {
  const Model driver;
  const std::vector<Model::Place> places = driver.places();
  for (std::size_t i = 1; i < places.size(); ++i) {
    EXPECT_LT(reinterpret_cast<std::uintptr_t>(places[i - 1].address),
              reinterpret_cast<std::uintptr_t>(places[i].address))
        << places[i - 1].name << " stands before " << places[i].name;
  }
}

TEST(DriverObject, StartsWithTheDefaultsOfItsRecords) {
  const Model driver;
  EXPECT_EQ(driver.m_FixedSystemInfo.modelName, "Unknown");
  EXPECT_EQ(driver.m_FixedSystemInfo.version, "1.0.0.0");
  EXPECT_EQ(driver.m_FixedSystemInfo.maker, "Vexa Corporation");
  EXPECT_TRUE(driver.m_FixedConnectionInfo.flag1);
  EXPECT_EQ(driver.m_FixedConnectionInfo.text, "0-0");
  EXPECT_EQ(driver.m_FixedCameraInfo.electronicFlip, 0);
  EXPECT_EQ(driver.m_CameraInfo.codecType, 1);
  EXPECT_EQ(driver.m_CameraInfo.reserved19, 7);
  EXPECT_EQ(driver.m_AudioInfo.codec, "none");
  EXPECT_TRUE(driver.m_ConnectionInfo.host.empty());
  EXPECT_FALSE(driver.m_ContinuousPTZ);
  EXPECT_EQ(driver.m_ChannelId, 0);
  EXPECT_FALSE(driver.m_CGILogEnabled);
  EXPECT_STREQ(driver.m_CGILogPath, "");
  EXPECT_EQ(sizeof driver.m_CGILogPath, 1024U);
  EXPECT_EQ(driver.m_CameraType, 0U);
  EXPECT_FALSE(driver.m_UseMotionDetection);
  EXPECT_TRUE(driver.m_ZoomRatios.empty());
  EXPECT_EQ(driver.m_StagingBuffer, nullptr);
  EXPECT_EQ(driver.m_StreamingThread, nullptr);
}

TEST(DriverObject, HasNoCapabilityRecordsUntilAModelClassFillsThem) {
  const Model driver;
  EXPECT_FALSE(driver.m_FixedCameraInfoAvailable);
  EXPECT_FALSE(driver.m_FixedPTZControlInfoAvailable);
  EXPECT_FALSE(driver.m_FixedIoBoxInfoAvailable);
}

TEST(DriverObject, SetsASizeAsideForTheAnswerToEachInquiry) {
  const std::map<std::string, int> expected = {
      {"system", 10240},     {"network", 10240},     {"camera", 8192}, {"presetposition", 131072},
      {"sensor", 512},       {"lod", 1024},          {"a-slot", 512},  {"objectdetection", 524288},
      {"edgestorage", 1024}, {"audiodetection", 512}};
  EXPECT_EQ(Model().m_InquirySizes, expected);
}

struct Room {
  const char* list;
  std::size_t capacity;
  std::size_t size;
};

TEST(DriverObject, HasRoomFor32EntriesInEachListOfItsRecords) {
  const Model driver;
#define ROOM(list) \
  { #list, driver.list.capacity(), driver.list.size() }
  const Room rooms[] = {
      ROOM(m_FixedCameraInfo.codecs),
      ROOM(m_FixedCameraInfo.reserved2),
      ROOM(m_FixedCameraInfo.reserved4),
      ROOM(m_FixedAudioInfo.inputCodecs),
      ROOM(m_FixedAudioInfo.outputCodecs),
      ROOM(m_FixedAudioInfo.reserved3),
      ROOM(m_FixedAudioInfo.reserved4),
      ROOM(m_FixedPTZControlInfo.reserved1),
      ROOM(m_FixedPTZControlInfo.zoomSteps),
      ROOM(m_FixedPTZControlInfo.brightModes),
      ROOM(m_FixedPTZControlInfo.dayNightModes),
      ROOM(m_IoBoxInfo.pins),
      ROOM(m_IoBoxInfo.detections1),
      ROOM(m_IoBoxInfo.detections2),
  };
#undef ROOM
  for (const Room& room : rooms) {
    EXPECT_GE(room.capacity, 32U) << room.list;
    EXPECT_EQ(room.size, 0U) << room.list;
  }
}

TEST(DriverObject, HasEightLocksWhichAThreadMayTakeAgain) {
  Model driver;
  const std::vector<CSimpleLock*> locks = driver.locks();
  ASSERT_EQ(locks.size(), 8U);
  for (CSimpleLock* lock : locks) {
    const vexa::Guard once(*lock);
    const vexa::Guard again(*lock);
  }
}

TEST(DriverObject, StartsWithAnEmptyLatestErrorText) {
  CVexaCommon driver;
  std::string text = "the caller's";
  EXPECT_EQ(driver.GetLatestErrorText(text), LIBD_OK);
  EXPECT_EQ(text, "");
}

TEST(DriverObject, StartsWithLatestErrorCodeZero) { EXPECT_EQ(Model().m_LatestErrorCode, 0); }

TEST(DriverObject, HandsOutTheTextOfTheLatestFailure) {
  Model driver;
  driver.m_LatestErrorText = "Receive timed out";
  std::string text;
  EXPECT_EQ(driver.GetLatestErrorText(text), LIBD_OK);
  EXPECT_EQ(text, "Receive timed out");
  EXPECT_EQ(driver.m_LatestErrorText, "Receive timed out") << "reading it does not spend it";
}

struct TypeCase {
  std::uint32_t camera;
  std::uint32_t asked;
  int answer;
};

TEST(DriverObject, ReportsWhetherTheCameraHasABitOfTheTypeAskedFor) {
  constexpr TypeCase kCases[] = {
      {0, 0, 0}, {0, 0xFFFFFFFF, 0},          {1, 1, 1},          {1, 2, 0},
      {6, 3, 1}, {0x80000000, 0x80000000, 1}, {0xFFFFFFFF, 0, 0}, {0x7FFFFFFF, 0x80000000, 0}};
  for (const TypeCase& c : kCases) {
    Model driver;
    driver.m_CameraType = c.camera;
    EXPECT_EQ(driver.GetCameraType(static_cast<ELibCameraType>(c.asked)), c.answer) << c.camera << " " << c.asked;
  }
}

TEST(DriverObject, InitializeFixedVideoParamsDoesNothing) {
  EXPECT_EQ(Model().InitializeFixedVideoParams(LIBD_VIDEO_NTSC, 1920, 1080), LIBD_OK);
}

TEST(DriverObject, LeavesToTheBaseWhatThisFamilyDoesNotOffer) {
  CVexaCommon driver;
  SLibDSystemInfo system;
  SLibDIoBoxInfo box;
  SLibDAudioFrameInfo audio;
  ELibVideoOutMode mode{};
  std::string capabilities;
  EXPECT_EQ(driver.SetCurrentSystemInfo(system), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.SetIoBoxInfo(box), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.StartAudioUpLoad(), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.StopAudioUpload(), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.SetAudioUploadFrame(audio), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.GetVideoStatus(0), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.GetVideoOutMode(mode), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.ImportCapabilities(capabilities), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.ExportCapabilities(capabilities), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.InitializeEncoderDevice(), LIBD_OK);
  EXPECT_EQ(driver.CloseEncoderDevice(), LIBD_OK);
  EXPECT_FALSE(driver.GetAnalogDeviceInitializedStatus());
}

/// A listening socket on the loopback: what a driver sends anywhere waits here.
class Listener {
 public:
  Listener() : socket_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t length = sizeof address;
    EXPECT_EQ(bind(socket_, reinterpret_cast<sockaddr*>(&address), length), 0);
    EXPECT_EQ(listen(socket_, 1), 0);
    EXPECT_EQ(getsockname(socket_, reinterpret_cast<sockaddr*>(&address), &length), 0);
    port_ = ntohs(address.sin_port);
  }
  ~Listener() { close(socket_); }
  Listener(const Listener&) = delete;
  Listener& operator=(const Listener&) = delete;

  int port() const { return port_; }
  bool was_called() const {
    pollfd entry{socket_, POLLIN, 0};
    return poll(&entry, 1, 0) != 0;
  }

 private:
  int socket_;
  int port_ = 0;
};

struct StreamCounts {
  int first;
  int second;
};

TEST(DriverObject, SwitchingAStreamOffSendsNothingToASingleStreamCamera) {
  for (const StreamCounts& counts : {StreamCounts{0, 0}, {1, 1}, {1, 0}, {-1, 1}}) {
    const Listener camera;
    Model driver;
    driver.m_ConnectionInfo.host = "127.0.0.1";
    driver.m_ConnectionInfo.port = camera.port();
    driver.m_FixedCameraInfo.streamCount1 = counts.first;
    driver.m_FixedCameraInfo.streamCount2 = counts.second;
    EXPECT_EQ(driver.SetCameraInfoFromID(2), LIBD_OK) << counts.first << " " << counts.second;
    EXPECT_FALSE(camera.was_called()) << counts.first << " " << counts.second;
  }
}

struct SwitchedOff {
  StreamCounts counts;
  unsigned int id;
  const char* command;
  const char* answer;
  ELibDReturnCode result;
};

TEST(DriverObject, SwitchingAStreamOffIsOneCommand) {
  const SwitchedOff cases[] = {
      {{2, 0}, 1, "ImageCodec1=off", "HTTP/1.0 200 OK\r\n\r\n", LIBD_OK},
      {{1, 2}, 2, "ImageCodec2=off", "HTTP/1.0 204 No Content\r\n\r\n", LIBD_OK},
      {{2, 2}, 4294967295U, "ImageCodec-1=off", "HTTP/1.0 200 OK\r\n\r\n", LIBD_OK},
      {{2, 2}, 3, "ImageCodec3=off", "HTTP/1.0 401 Unauthorized\r\n\r\n", LIBD_UNAUTHORIZED},
      {{2, 2}, 3, "ImageCodec3=off", "HTTP/1.0 404 Not Found\r\n\r\n", LIBD_FAILED},
  };
  for (const SwitchedOff& c : cases) {
    const std::string request = std::string("GET http://{host}:{port}/command/camera.cgi?") + c.command +
                                " HTTP/1.0\r\nAuthorization: Basic Og==\r\n\r\n";
    ScriptedCamera camera({{.expected = request, .answer = c.answer}});
    Model driver;
    driver.m_ConnectionInfo.host = camera.host();
    driver.m_ConnectionInfo.port = camera.port();
    driver.m_ConnectionInfo.timeout = 5000;
    driver.m_FixedCameraInfo.streamCount1 = c.counts.first;
    driver.m_FixedCameraInfo.streamCount2 = c.counts.second;
    EXPECT_EQ(driver.SetCameraInfoFromID(c.id), c.result) << c.answer;
    EXPECT_EQ(camera.finish(), "");
  }
}

TEST(DriverObject, ItsEndClosesTheStopEvent) {
  const std::size_t before = open_descriptors();
  {
    const Model driver;
    ASSERT_NE(driver.m_StopVideoEvent, nullptr);
    EXPECT_EQ(open_descriptors(), before + 2);
  }
  EXPECT_EQ(open_descriptors(), before);
}

#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)
// Under a sanitizer its own leak check shows the same.
TEST(DriverObject, ItsEndFreesTheByteArray) {
  constexpr std::size_t kOwnMapping = std::size_t{40} << 20;
  const std::size_t before = mallinfo2().hblkhd;
  {
    Model driver;
    driver.m_StagingBuffer = new unsigned char[kOwnMapping];
    EXPECT_GE(mallinfo2().hblkhd, before + kOwnMapping);
  }
  EXPECT_EQ(mallinfo2().hblkhd, before);
}

TEST(DriverObject, ItsEndFreesThePacketBuffer) {
  constexpr std::size_t kOwnMapping = std::size_t{40} << 20;
  const std::size_t before = mallinfo2().hblkhd;
  {
    Model driver;
    driver.m_RtpPacketBuffer = static_cast<unsigned char*>(malloc(kOwnMapping));
    EXPECT_GE(mallinfo2().hblkhd, before + kOwnMapping);
  }
  EXPECT_EQ(mallinfo2().hblkhd, before);
}
#endif

TEST(DriverObject, ItsEndIsReachedThroughTheContract) {
  const std::size_t before = open_descriptors();
  std::unique_ptr<CLibraryDevice> device = std::make_unique<CVexaCommon>();
  device.reset();
  EXPECT_EQ(open_descriptors(), before);
}

}  // namespace
}  // namespace vexa_test

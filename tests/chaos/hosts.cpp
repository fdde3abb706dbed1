// SPDX-License-Identifier: Apache-2.0
#include "tests/chaos/hosts.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <utility>

#include "vexa/statistics.h"
#include "vexa/trace.h"

namespace vexa_test {
namespace {

// Of each operation, on whatever machine: far more than all time-outs that one can meet together.
constexpr std::chrono::minutes kLongest{5};
constexpr int kTimeout = 1000;  // milliseconds; the driver looks for an answer once a second
constexpr std::size_t kMostSessions = 3;

SLibDConnectionInfo connection_to(vexa::camera::VirtualCamera& camera, bool rtp) {
  SLibDConnectionInfo connection;
  connection.streamTransport = rtp ? 1 : 0;
  connection.host = camera.address();
  connection.port = camera.http_port();
  connection.timeout = kTimeout;
  connection.userName = connection.password = "admin";
  return connection;
}

class Frame final : public CDataSink {
 public:
  void Write(const unsigned char* data, unsigned int length) override {
    bytes.assign(reinterpret_cast<const char*>(data), length);
  }
  std::string bytes;
};

struct Operation {
  const char* name;
  void (*call)(CVexaCommon& driver);
};

template <ELibDReturnCode (CLibraryDevice::*kOperation)()>
void plain(CVexaCommon& driver) {
  (driver.*kOperation)();
}

template <typename Record, ELibDReturnCode (CLibraryDevice::*kOperation)(Record&)>
void with(CVexaCommon& driver) {
  Record record{};
  (driver.*kOperation)(record);
}

void poll_sound(CVexaCommon& driver) {
  unsigned char room[2000];
  SLibDAudioFrameInfo frame;
  frame.data = room;
  frame.capacity = sizeof room;
  if (driver.GetCurrentAudioFrame(frame) == LIBD_OK && frame.length > frame.capacity) {
    Findings::stop_at("more sound than there is room for");
  }
}

using D = CLibraryDevice;

constexpr Operation kOperations[] = {
    {"StartVideoStreaming", plain<&D::StartVideoStreaming>},
    {"StartVideoStreaming", plain<&D::StartVideoStreaming>},
    {"StopVideoStreaming", plain<&D::StopVideoStreaming>},
    {"GetCurrentVideoFrame", nullptr},
    {"GetCurrentVideoFrame", nullptr},
    {"GetCurrentVideoFrame", nullptr},
    {"Cancel", [](CVexaCommon& driver) { vexa::Cancel(driver); }},
    {"GetCameraInfo", with<SLibDCameraInfo, &D::GetCameraInfo>},
    {"GetCurrentSystemInfo", with<SLibDSystemInfo, &D::GetCurrentSystemInfo>},
    {"GetDayNightMode", with<ELibDDayNightType, &D::GetDayNightMode>},
    {"SetViewDR", [](CVexaCommon& driver) { driver.SetViewDR(LIBD_VIEWDR_ON); }},
    {"GetPresets", with<std::vector<SLibDPresetInfo>, &D::GetPresets>},
    {"StartIoStreaming", plain<&D::StartIoStreaming>},
    {"GetCurrentIoStatus", with<std::vector<SLibDPinInfo>, &D::GetCurrentIoStatus>},
    {"StopIoStreaming", plain<&D::StopIoStreaming>},
    {"StartModRawData", plain<&D::StartModRawData>},
    {"GetCurrentPosition", with<SLibDRawMDFrameInfo, &D::GetCurrentPosition>},
    {"StopModRawData", plain<&D::StopModRawData>},
    {"StartAudioStreaming", plain<&D::StartAudioStreaming>},
    {"GetCurrentAudioFrame", poll_sound},
    {"StopAudioStreaming", plain<&D::StopAudioStreaming>},
};

}  // namespace

void Findings::stop_at(const std::string& wrong) {
  std::fprintf(stderr, "chaos: %s\n", wrong.c_str());
  std::fflush(nullptr);
  _exit(1);
}

void OperationClock::look() const {
  const char* const operation = operation_;
  if (operation == nullptr) return;
  const auto now = std::chrono::steady_clock::now().time_since_epoch();
  if (now - std::chrono::steady_clock::duration(since_) > kLongest)
    Findings::stop_at(std::string(operation) + " does not return");
}

ChaosDriver::ChaosDriver(ChaosCameras& cameras, std::size_t camera, bool rtp) : cameras_(cameras), rtp_(rtp) {
  vexa::SetTrace(driver_, [](const char*) {});
  driver_.SetCGILogPath("/dev/null");
  SLibDConnectionInfo connection = connection_to(cameras.at(camera), rtp);
  driver_.SetCurrentConnectionInfo(connection);
}

ChaosDriver::~ChaosDriver() { driver_.StopModRawData(); }

std::size_t ChaosDriver::operations() { return std::size(kOperations); }

const char* ChaosDriver::name_of(std::size_t chosen) { return kOperations[chosen % operations()].name; }

void ChaosDriver::operate(std::size_t chosen) {
  const Operation& operation = kOperations[chosen % operations()];
  if (operation.call != nullptr) {
    operation.call(driver_);
  } else {
    take_frames();
  }
  check_counts();
}

void ChaosDriver::take_frames() {
  constexpr int kMost = 20;
  Frame frame;
  SLibDVideoFrameInfo info;
  info.sink = &frame;
  for (int i = 0; i < kMost && driver_.GetCurrentVideoFrame(info) == LIBD_OK; ++i) {
    // An HTTP stream that is cut, or begins in mid-picture, may have a frame of pieces; over RTP each is whole.
    if (rtp_ && !cameras_.sends(frame.bytes)) Findings::stop_at("a frame is not one of the camera's pictures");
  }
}

void ChaosDriver::check_counts() {
  vexa::StreamStatistics s;
  vexa::GetStreamStatistics(driver_, s);
  if (s.packetsReceived != s.packetsUsed + s.packetsDuplicated + s.packetsDiscarded + s.packetsHeld) {
    Findings::stop_at("the counts of packets received do not balance");
  }
  if (s.framesBegun != s.framesHandedOut + s.framesDropped + s.framesHeldInAssembly + s.framesHeldInQueue) {
    Findings::stop_at("the counts of frames do not balance");
  }
  if (s.packetsExpected != s.packetsReceivedOnce + s.packetsMissing + s.packetsMissingInCamera) {
    Findings::stop_at("the counts of packets expected do not balance");
  }
}

ChaosHost::ChaosHost(ChaosCameras& cameras, ChaosDriver& shared, std::uint32_t seed)
    : cameras_(cameras), shared_(shared), random_(seed) {}

void ChaosHost::step() {
  if (random_() % 3 == 0) {
    use_session();
  } else {
    drive();
  }
  clock_.end();
  ++steps_;
}

void ChaosHost::drive() {
  const auto chosen = static_cast<std::size_t>(random_());
  if (random_() % 3 == 0) {
    clock_.begin(ChaosDriver::name_of(chosen));
    return shared_.operate(chosen);
  }
  if (!own_ || random_() % 12 == 0) {
    clock_.begin("a driver's destructor");
    own_.reset();
    const auto camera = static_cast<std::size_t>(random_());
    clock_.begin("a driver's constructor");
    own_ = std::make_unique<ChaosDriver>(cameras_, camera, random_() % 2 == 0);
  }
  clock_.begin(ChaosDriver::name_of(chosen));
  own_->operate(chosen);
}

void ChaosHost::open_session() {
  vexa::SessionOptions options;
  options.connection = connection_to(cameras_.at(random_()), true);
  options.streams = static_cast<std::uint32_t>(1 + random_() % 15);
  options.stallMilliseconds = 300;
  options.giveUpMilliseconds = 1000;
  vexa::SessionCallbacks callbacks;
  callbacks.frame = [this](vexa::Session&, const vexa::SessionFrame& frame) {
    if (!cameras_.sends(std::string(reinterpret_cast<const char*>(frame.data), frame.length))) {
      Findings::stop_at("a session's frame is not one of the camera's pictures");
    }
  };
  auto latest = std::make_shared<std::uint64_t>(0);
  callbacks.state = [latest](vexa::Session&, const vexa::SessionStatus& status) {
    if (status.event <= *latest) Findings::stop_at("a session's events go back");
    if (*latest != 0 && status.event != *latest + status.missed + 1) Findings::stop_at("a session's events have a gap");
    *latest = status.event;
  };
  if (!group_) group_ = std::make_unique<vexa::SessionGroup>();
  if (auto session = group_->Open(options, callbacks)) sessions_.push_back(std::move(session));
}

void ChaosHost::use_session() {
  const std::size_t which = sessions_.empty() ? 0 : random_() % sessions_.size();
  switch (random_() % 8) {
    case 0:
    case 1:
      clock_.begin("SessionGroup::Open");
      if (sessions_.size() < kMostSessions) open_session();
      return;
    case 2:
      clock_.begin("Session::Retry");
      if (!sessions_.empty()) sessions_[which]->Retry();
      return;
    case 3:
      clock_.begin("Session::SetCredentials");
      if (!sessions_.empty()) sessions_[which]->SetCredentials("admin", random_() % 4 == 0 ? "wrong" : "admin");
      return;
    case 4:
      clock_.begin("Session::Status");
      if (sessions_.empty()) return;
      if (const vexa::SessionStatus status = sessions_[which]->Status(); status.why.empty() && status.event != 0) {
        Findings::stop_at("a session has no words for its state");
      }
      return;
    case 5:
    case 6:
      clock_.begin("Session::WaitStopped");
      if (sessions_.empty()) return;
      sessions_[which]->Stop();
      if (!sessions_[which]->WaitStopped(-1)) Findings::stop_at("a wait without limit has an end");
      sessions_.erase(sessions_.begin() + static_cast<std::ptrdiff_t>(which));
      return;
    default:
      clock_.begin("SessionGroup's destructor");
      sessions_.clear();
      group_.reset();
  }
}

void ChaosHost::finish() {
  clock_.begin("SessionGroup's destructor");
  sessions_.clear();
  group_.reset();
  clock_.begin("a driver's destructor");
  own_.reset();
  clock_.end();
}

}  // namespace vexa_test

// SPDX-License-Identifier: Apache-2.0
#include "session/camera_line.h"

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <iterator>
#include <vector>

#include "vexa/failure.h"
#include "vexa/stream_choice.h"
#include "vexa/trace.h"

namespace vexa {
namespace {

// The driver opens its CGI log with every connection; unnamed, it would be a file in the working folder. This one is in
// memory, and gone when the driver closes it.
class PrivateLog {
 public:
  PrivateLog() : memory_(memfd_create("vexa-session-log", MFD_CLOEXEC)) {}
  ~PrivateLog() {
    if (memory_ >= 0) close(memory_);
  }
  PrivateLog(const PrivateLog&) = delete;
  PrivateLog& operator=(const PrivateLog&) = delete;
  [[nodiscard]] std::string path() const { return "/proc/self/fd/" + std::to_string(memory_); }

 private:
  const int memory_;
};

bool is_installed(const std::string& model) {
  const std::vector<std::string> names = ProfileNames();
  return std::find(names.begin(), names.end(), model) != names.end();
}

// As SLibDAudioFrameInfo::codecType.
constexpr std::int32_t kG711 = 10;
constexpr std::int32_t kG726 = 20;

struct StreamStart {
  std::uint32_t stream;
  ELibDReturnCode (CLibraryDevice::*start)();
  ELibDReturnCode (CLibraryDevice::*stop)();
};

constexpr StreamStart kStarts[] = {
    {kVideoStream, &CLibraryDevice::StartVideoStreaming, &CLibraryDevice::StopVideoStreaming},
    {kAlarmStream, &CLibraryDevice::StartIoStreaming, &CLibraryDevice::StopIoStreaming},
    {kMetadataStream, &CLibraryDevice::StartModRawData, &CLibraryDevice::StopModRawData},
    {kAudioStream, &CLibraryDevice::StartAudioStreaming, &CLibraryDevice::StopAudioStreaming}};

}  // namespace

CameraLine::~CameraLine() {
  cancel();
  device_.reset();
}

std::optional<LineFailure> CameraLine::open(const std::string& user, const std::string& password, Watcher& watcher) {
  token_.Reset();
  if (watcher.is_cancelled()) token_.Cancel();
  SLibDConnectionInfo connection = options_.connection;
  connection.userName = user;
  connection.password = password;
  if (auto failed = identify(connection)) return failed;
  for (const StreamStart& row : kStarts) {
    if ((options_.streams & row.stream) == 0) continue;
    if (auto failed = start(row.stream)) {
      close();
      return failed;
    }
  }
  return std::nullopt;
}

std::optional<LineFailure> CameraLine::identify(const SLibDConnectionInfo& connection) {
  if (device_) {
    introduce(*device_, connection);
  } else {
    Profile profile;
    ProfileError error;
    if (!options_.profile.empty() && !LoadProfile(options_.profile, profile, error)) {
      return LineFailure{LIBD_INVALID_ARGUMENT, error.Message(), true};
    }
    if (auto failed = make_driver(profile, connection)) return failed;
  }
  SLibDSystemInfo system;
  const ELibDReturnCode asked = device_->GetCurrentSystemInfo(system);
  if (asked != LIBD_OK) return failure(asked);
  if (!options_.profile.empty()) return std::nullopt;
  const std::string model = is_installed(system.modelName) ? system.modelName : "";
  if (model == model_) return std::nullopt;
  Profile profile;
  ProfileError error;
  if (!model.empty() && !LoadProfile(model, profile, error)) {
    return LineFailure{LIBD_INVALID_ARGUMENT, error.Message(), true};
  }
  if (auto failed = make_driver(profile, connection)) return failed;
  model_ = model;
  return std::nullopt;
}

std::optional<LineFailure> CameraLine::make_driver(const Profile& profile, const SLibDConnectionInfo& connection) {
  std::unique_ptr<CLibraryDevice> device = MakeDevice(profile);  // and the former one, which goes with no lock held
  auto* driver = dynamic_cast<CVexaCommon*>(device.get());
  if (driver == nullptr || !SetTrace(*driver, [](const char*) {})) return LineFailure{LIBD_FAILED, "out of memory"};
  SetCancelToken(*driver, token_);
  // Detectors of simple cameras report as one item, all others window by window.
  device->SetVMDtype(profile.lodDetection ? LIBD_VMD_VMF : LIBD_VMD_WINDOW);
  introduce(*device, connection);
  const std::lock_guard<std::mutex> lock(mutex_);
  device_.swap(device);
  driver_ = driver;
  return std::nullopt;
}

// The driver opens the log anew each time.
void CameraLine::introduce(CLibraryDevice& device, const SLibDConnectionInfo& connection) const {
  const PrivateLog unshown;
  device.SetCGILogPath(options_.cgiLog.empty() ? unshown.path().c_str() : options_.cgiLog.c_str());
  device.SetCGILogLevel(!options_.cgiLog.empty());
  SLibDConnectionInfo given = connection;
  device.SetCurrentConnectionInfo(given);
}

std::optional<LineFailure> CameraLine::start(std::uint32_t stream) {
  if (stream == kVideoStream) {
    const ELibDReturnCode selected = SelectStream(*driver_, options_.stream);
    if (selected == LIBD_NOT_SUPPORTED) return LineFailure{selected, "the camera has no such stream"};
    if (selected != LIBD_OK) return failure(selected);
  }
  if (stream == kAudioStream) {
    // The driver itself knows a codec only that it has set.
    SLibDAudioInfo sound;
    const ELibDReturnCode asked = device_->GetAudioInfo(sound);
    if (asked != LIBD_OK) return failure(asked);
    sound_codec_ = sound.codec == "G711" ? kG711 : (sound.codec == "G726" ? kG726 : -1);
  }
  const auto* row = std::find_if(std::begin(kStarts), std::end(kStarts),
                                 [stream](const StreamStart& s) { return s.stream == stream; });
  const ELibDReturnCode started = (device_.get()->*row->start)();
  if (started == LIBD_OK) return std::nullopt;
  return failure(started);
}

std::optional<LineFailure> CameraLine::ask() {
  SLibDSystemInfo system;
  const ELibDReturnCode asked = device_->GetCurrentSystemInfo(system);
  if (asked == LIBD_OK) return std::nullopt;
  return failure(asked);
}

void CameraLine::close() {
  if (!device_) return;
  token_.Cancel();
  for (auto row = std::rbegin(kStarts); row != std::rend(kStarts); ++row) {
    if ((options_.streams & row->stream) != 0) (device_.get()->*row->stop)();
  }
}

std::string CameraLine::latest_text() const { return driver_ == nullptr ? "" : LastFailure(*driver_).text; }

bool CameraLine::statistics(StreamStatistics& statistics) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (driver_ == nullptr) return false;
  GetStreamStatistics(*driver_, statistics);
  return true;
}

}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
#include "host/camera/live_camera.h"

#include <fmt/format.h>
#include <sys/mman.h>

#include <algorithm>
#include <atomic>
#include <cstring>

#include "host/access/redactor.h"
#include "host/base/printable.h"
#include "host/base/unique_fd.h"
#include "host/console/interrupt.h"
#include "host/words/card_mode.h"
#include "vexa/cancel.h"
#include "vexa/failure.h"
#include "vexa/trace.h"

namespace vexa::host {
namespace {

constexpr int kOverHttp = 0;
constexpr int kOverRtsp = 1;
constexpr int kLastCallTimeout = 300;  // milliseconds, of which a request may take two

std::atomic<CancelToken*> cancelled_by_signal{nullptr};
static_assert(std::atomic<CancelToken*>::is_always_lock_free);

// The driver opens its CGI log with every connection; unnamed, it would be a file in the working folder. This one is in
// memory and gone with the driver. /dev/null would not do: the driver syncs the log to disk and reports a failure
// there.
class PrivateLog {
 public:
  [[nodiscard]] std::string path() const { return fmt::format("/proc/self/fd/{}", memory_.get()); }

 private:
  UniqueFd memory_{memfd_create("vexactl-cgi-log", MFD_CLOEXEC)};
};

// Cancelled by Ctrl-C. Never destroyed, so that a signal finds it until the process has gone.
const CancelToken& interruption() {
  static CancelToken& token = []() -> CancelToken& {
    auto* made = new CancelToken;
    cancelled_by_signal = made;
    Interrupt::also([] { cancelled_by_signal.load()->Cancel(); });
    return *made;
  }();
  return token;
}

void connect(CLibraryDevice& device, const CameraConnection& connection, int timeout_ms) {
  const PrivateLog unshown;
  device.SetCGILogPath(connection.cgi_log.value_or(unshown.path()).c_str());
  device.SetCGILogLevel(connection.cgi_log.has_value());
  SLibDConnectionInfo info;
  info.streamTransport = connection.transport == VideoTransport::kHttp ? kOverHttp : kOverRtsp;
  info.host = connection.address.host;
  info.port = connection.address.port;
  info.timeout = timeout_ms;
  info.userName = connection.credentials.user;
  info.password = connection.credentials.password;
  device.SetCurrentConnectionInfo(info);
}

bool mentions_unauthorized(const std::string& text) { return strcasestr(text.c_str(), "unauthorized") != nullptr; }

}  // namespace

void introduce(CLibraryDevice& device, const CameraConnection& connection) {
  if (auto* driver = dynamic_cast<CVexaCommon*>(&device)) {
    SetTrace(*driver, connection.trace);
    SetCancelToken(*driver, interruption());
  }
  connect(device, connection, connection.timeout_ms);
}

void allow_last_call(CLibraryDevice& device, const CameraConnection& connection) {
  if (!Interrupt::requested()) return;
  if (auto* driver = dynamic_cast<CVexaCommon*>(&device)) RemoveCancelToken(*driver);
  connect(device, connection, std::min(connection.timeout_ms, kLastCallTimeout));
}

LiveCamera::LiveCamera(const CameraConnection& connection) : connection_(connection) { introduce(*this, connection); }

Result<LiveCamera::Identity> LiveCamera::identify(int stream) {
  Identity identity;
  ELibDReturnCode result = GetCurrentSystemInfo(identity.system);
  if (result != LIBD_OK) return fail(explain(result));
  m_ConnectionLock.Lock();
  m_CameraInfo.streamNumber = stream;
  m_ConnectionLock.Unlock();
  identity.video.streamNumber = stream;
  result = GetCameraInfo(identity.video);
  if (result != LIBD_OK) return fail(explain(result));
  std::string codec = identity.video.codecName;
  m_ConnectionLock.Lock();
  m_CameraInfo.codecType = identity.video.codecType;
  m_CameraInfo.codecName.swap(codec);
  m_ConnectionLock.Unlock();
  return identity;
}

Result<std::size_t> LiveCamera::inquire(const std::string& section) {
  std::string answer;
  const ELibDReturnCode result = SendInqCommand(section, answer);
  if (result != LIBD_OK) return fail(explain(result));
  return answer.size();
}

Result<CardMode> LiveCamera::card_mode() {
  std::string answer;
  const ELibDReturnCode result = SendInqCommand("edgestorage", answer);
  if (result != LIBD_OK) return fail(explain(result));
  CardMode mode;
  mode.recording = read_card_mode(answer);
  mode.free_kilobytes = std::max(CheckEdgeStorageFreeSize(), 0);
  return mode;
}

ELibDReturnCode LiveCamera::end_alarm_data() {
  const int socket = http_open("/command/system.cgi?AlarmData=off");
  if (socket < 0) return LIBD_FAILED;
  http_close(socket);
  return LIBD_OK;
}

bool left_a_reason(CLibraryDevice& device) {
  std::string text;
  device.GetLatestErrorText(text);
  return !text.empty();
}

bool was_interrupted(CLibraryDevice& device) {
  auto* driver = dynamic_cast<CVexaCommon*>(&device);
  return Interrupt::requested() && driver != nullptr && LastFailure(*driver).cancelled;
}

Problem interrupted() { return {ExitCode::kInterrupted, "interrupted while the camera was asked", ""}; }

Problem explain_failure(CLibraryDevice& device, ELibDReturnCode result, const CameraConnection& connection) {
  if (was_interrupted(device)) return interrupted();
  std::string text;
  device.GetLatestErrorText(text);
  const std::string why = text.empty() ? "no answer" : printable(Redactor(connection.credentials)(text));
  const std::string camera = to_string(connection.address);
  // A refused RTSP session returns LIBD_STREAM_OPEN_FAILED for any reason; only the text distinguishes them.
  if (result == LIBD_UNAUTHORIZED || mentions_unauthorized(text)) {
    return {ExitCode::kUnauthorized, fmt::format("the camera {} refuses user name and password: {}", camera, why),
            fmt::format("Give them with --user and --password-file, --credentials FILE, or {} and {}.", kUserVariable,
                        kPasswordVariable)};
  }
  // An answer that never begins leaves no text.
  if (result == LIBD_TIMEOUT || text.empty()) {
    return {ExitCode::kUnreachable,
            fmt::format("the camera {} did not answer within {} ms: {}", camera, connection.timeout_ms, why),
            "Check address, power and network; a slow camera needs a longer --timeout."};
  }
  if (result == LIBD_STREAM_OPEN_FAILED) {
    return {ExitCode::kUnreachable, fmt::format("the camera {} does not open its video: {}", camera, why),
            "Check that its RTSP port 554 can be reached and that the stream is on."};
  }
  return {ExitCode::kUnreachable, fmt::format("the camera {} cannot be used: {}", camera, why),
          "Check that address and HTTP port are the camera's."};
}

}  // namespace vexa::host

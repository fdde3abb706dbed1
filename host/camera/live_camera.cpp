#include "host/camera/live_camera.h"

#include <fmt/format.h>
#include <sys/mman.h>

#include <algorithm>
#include <cstring>

#include "host/access/redactor.h"
#include "host/base/printable.h"
#include "host/base/unique_fd.h"
#include "host/words/card_mode.h"

namespace vexa::host {
namespace {

constexpr int kOverHttp = 0;
constexpr int kOverRtsp = 1;

// The driver opens its CGI log with every connection; unnamed, it would be a file in the working folder. This one is in
// memory and gone with the driver. /dev/null would not do: the driver syncs the log to disk and reports a failure
// there.
class PrivateLog {
 public:
  [[nodiscard]] std::string path() const { return fmt::format("/proc/self/fd/{}", memory_.get()); }

 private:
  UniqueFd memory_{memfd_create("vexactl-cgi-log", MFD_CLOEXEC)};
};

bool mentions_unauthorized(const std::string& text) { return strcasestr(text.c_str(), "unauthorized") != nullptr; }

}  // namespace

void introduce(CLibraryDevice& device, const CameraConnection& connection) {
  const PrivateLog unshown;
  device.SetCGILogPath(connection.cgi_log.value_or(unshown.path()).c_str());
  device.SetCGILogLevel(connection.cgi_log.has_value());
  SLibDConnectionInfo info;
  info.streamTransport = connection.transport == VideoTransport::kHttp ? kOverHttp : kOverRtsp;
  info.host = connection.address.host;
  info.port = connection.address.port;
  info.timeout = connection.timeout_ms;
  info.userName = connection.credentials.user;
  info.password = connection.credentials.password;
  device.SetCurrentConnectionInfo(info);
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

Result<CardMode> LiveCamera::card_mode() {
  std::string answer;
  const ELibDReturnCode result = SendInqCommand("edgestorage", answer);
  if (result != LIBD_OK) return fail(explain(result));
  CardMode mode;
  mode.recording = read_card_mode(answer);
  mode.free_kilobytes = std::max(CheckEdgeStorageFreeSize(), 0);
  return mode;
}

bool left_a_reason(CLibraryDevice& device) {
  std::string text;
  device.GetLatestErrorText(text);
  return !text.empty();
}

Problem explain_failure(CLibraryDevice& device, ELibDReturnCode result, const CameraConnection& connection) {
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

// SPDX-License-Identifier: Apache-2.0
// The driver as vexactl uses it, and its failures in words.
#ifndef HOST_CAMERA_LIVE_CAMERA_H_
#define HOST_CAMERA_LIVE_CAMERA_H_

#include <functional>
#include <optional>
#include <string>

#include "host/access/camera_address.h"
#include "host/access/credentials.h"
#include "host/base/problem.h"
#include "vexa/vexa_common.h"

namespace vexa::host {

// The transport of pictures: RTP in datagrams, set up by RTSP, or the camera's HTTP image stream.
enum class VideoTransport { kUdp, kHttp };

struct CameraConnection {
  CameraAddress address;
  Credentials credentials;
  int timeout_ms = 0;
  VideoTransport transport = VideoTransport::kUdp;
  std::optional<std::string> cgi_log = {};  // the file that requests and statuses are appended to
  // Takes what the driver traces of RTSP.
  std::function<void(const char* text)> trace = [](const char*) {};
};

// Gives a driver its camera's address, the file of its CGI log and the receiver of its trace, and lets an interruption
// end what waits for the camera. Contacts no camera.
void introduce(CLibraryDevice& device, const CameraConnection& connection);

// Before a call that leaves the camera as it was found: after an interruption it still reaches the camera, and waits
// for it no longer than a moment.
void allow_last_call(CLibraryDevice& device, const CameraConnection& connection);

// Puts a driver's latest failure into words; `result` is what the failed operation returned.
[[nodiscard]] Problem explain_failure(CLibraryDevice& device, ELibDReturnCode result,
                                      const CameraConnection& connection);

// Whether Ctrl-C, and not the camera, ended the operation that failed last; and how that is reported.
[[nodiscard]] bool was_interrupted(CLibraryDevice& device);
[[nodiscard]] Problem interrupted();

// Whether the latest failure has a text: a failed exchange leaves one, an answer that lacks a key none.
[[nodiscard]] bool left_a_reason(CLibraryDevice& device);

// A camera's settings for recording on its card.
struct CardMode {
  SLibDEdgeStorageMode recording;
  int free_kilobytes = 0;  // 0 also when no card is there
};

// A driver for any camera that streams video, whatever its model. Owned by a command; its operations may be called from
// any thread, as the driver's.
class LiveCamera final : public CVexaCommon {
 public:
  // Gives the driver the camera's address; contacts no camera.
  explicit LiveCamera(const CameraConnection& connection);

  [[nodiscard]] Problem explain(ELibDReturnCode result) { return explain_failure(*this, result, connection_); }
  [[nodiscard]] const CameraConnection& connection() const { return connection_; }

  struct Identity {
    SLibDSystemInfo system;
    SLibDCameraInfo video;  // of the stream asked for
  };
  // Reads the camera's identity and the stream's settings, and selects the stream and its codec.
  [[nodiscard]] Result<Identity> identify(int stream);

  // Inquires a section; the bytes of its answer.
  [[nodiscard]] Result<std::size_t> inquire(const std::string& section);

  // Asks the camera: the driver's own record holds only a mode that this driver has set.
  [[nodiscard]] Result<CardMode> card_mode();

  // Lets the camera send no alarm data, whichever driver has asked it to.
  ELibDReturnCode end_alarm_data();

 private:
  const CameraConnection connection_;
};

}  // namespace vexa::host

#endif  // HOST_CAMERA_LIVE_CAMERA_H_

// The driver as vexactl uses it, and its failures in words.
#ifndef HOST_CAMERA_LIVE_CAMERA_H_
#define HOST_CAMERA_LIVE_CAMERA_H_

#include <optional>
#include <string>

#include "host/access/camera_address.h"
#include "host/access/credentials.h"
#include "host/base/problem.h"
#include "vexa/vexa_common.h"

namespace vexa::host {

// How pictures come: RTP in datagrams behind an RTSP session, or the camera's HTTP image stream.
enum class VideoTransport { kUdp, kHttp };

struct CameraConnection {
  CameraAddress address;
  Credentials credentials;
  int timeout_ms = 0;
  VideoTransport transport = VideoTransport::kUdp;
  std::optional<std::string> cgi_log = {};  // the file that requests and statuses are appended to
};

// Tells a driver where its camera is, and where its CGI log goes; contacts no camera.
void introduce(CLibraryDevice& device, const CameraConnection& connection);

// Puts a driver's latest failure into words; `result` is what the failed operation answered.
[[nodiscard]] Problem explain_failure(CLibraryDevice& device, ELibDReturnCode result,
                                      const CameraConnection& connection);

// Whether the latest failure has a text: a failed exchange leaves one, an answer that lacks a key none.
[[nodiscard]] bool left_a_reason(CLibraryDevice& device);

// How a camera is set to record on its card.
struct CardMode {
  SLibDEdgeStorageMode recording;
  int free_kilobytes = 0;  // 0 also when no card is there
};

// A model class for any camera that streams video.
class LiveCamera final : public CVexaCommon {
 public:
  // Tells the driver where the camera is; contacts none.
  explicit LiveCamera(const CameraConnection& connection);

  [[nodiscard]] Problem explain(ELibDReturnCode result) { return explain_failure(*this, result, connection_); }
  [[nodiscard]] const CameraConnection& connection() const { return connection_; }

  struct Identity {
    SLibDSystemInfo system;
    SLibDCameraInfo video;  // of the stream asked for
  };
  // Asks the camera what it is and what the stream is set to, and selects the stream and its codec.
  [[nodiscard]] Result<Identity> identify(int stream);

  // Asks the camera: the driver's own record of the mode knows only what it has set itself.
  [[nodiscard]] Result<CardMode> card_mode();

 private:
  const CameraConnection connection_;
};

}  // namespace vexa::host

#endif  // HOST_CAMERA_LIVE_CAMERA_H_

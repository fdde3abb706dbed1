// SPDX-License-Identifier: Apache-2.0
// What the connections of one camera share.
#ifndef VIRTUAL_CAMERA_SERVER_CAMERA_STATE_H_
#define VIRTUAL_CAMERA_SERVER_CAMERA_STATE_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/card/card.h"
#include "virtual_camera/model/login_guard.h"
#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/ptz/camera_pose.h"
#include "virtual_camera/ptz/ptz_head.h"
#include "virtual_camera/rtp/sent_log.h"
#include "virtual_camera/scene/alarm_scene.h"
#include "virtual_camera/scene/live_scene.h"
#include "virtual_camera/scene/scene_stage.h"
#include "virtual_camera/server/journal.h"
#include "virtual_camera/server/packet_fault_box.h"
#include "virtual_camera/server/request_faults.h"
#include "virtual_camera/source/stream_sources.h"
#include "virtual_camera/values/options.h"

namespace asio {
class io_context;
}

namespace vexa::camera {

class Connection;
class HttpBody;
class RtspSession;

// What connections and the control port may ask of the camera. All are empty while it is stopped.
struct CameraRequests {
  std::function<void(std::chrono::milliseconds away)> reboot;
  std::function<void(bool plugged)> set_network;
  std::function<void()> settings_changed;
};

// Held by every connection, so it outlives the last of them. Only the server knows it: what lies below is handed the
// members that it uses. Members without a lock of their own belong to the loop's thread, once the camera has started.
struct CameraState {
  CameraState(CameraOptions camera_options, asio::io_context& loop_context);
  ~CameraState();
  CameraState(const CameraState&) = delete;
  CameraState& operator=(const CameraState&) = delete;

  // Hosts that watch: RTSP sessions, and picture streams over HTTP.
  [[nodiscard]] std::size_t viewers();

  // Whether a request with this "Authorization" is let in; each that is asked about counts.
  [[nodiscard]] bool lets_in(std::string_view authorization);

  // The time that the camera's clock shows.
  [[nodiscard]] std::chrono::system_clock::time_point wall_clock() const;

  // For recordings and streams that begin afterwards.
  void set_clock(std::chrono::system_clock::time_point time);

  CameraOptions options;      // unchanged once the camera runs
  std::string profile_error;  // why the options' profile could not be loaded; empty: it was, or there is none
  asio::io_context& context;

  SettingsStore settings;
  AlarmScene alarms;
  std::string alarm_part;  // the newest part that went to the alarm streams
  SceneStage stage;
  Card card;
  std::unique_ptr<PtzHead> ptz;  // null: the camera does not move, or has no profile
  PoseSource pose;               // empty: the camera does not know where it looks
  LiveScene scene;
  StreamSources sources;

  LoginGuard logins;
  Journal journal;
  SentLog sent;
  RequestFaultList request_faults;
  PacketFaultBox packet_faults;

  std::chrono::system_clock::duration clock_ahead{0};  // of this machine's clock

  std::vector<std::weak_ptr<Connection>> connections;
  std::map<std::uint32_t, std::shared_ptr<RtspSession>> sessions;
  std::vector<std::weak_ptr<HttpBody>> picture_streams;
  std::uint32_t next_session;
  std::uint64_t plays = 0;  // streams begun
  CameraRequests requests;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_CAMERA_STATE_H_

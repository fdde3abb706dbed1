// SPDX-License-Identifier: Apache-2.0
// A network camera in software: HTTP commands and RTSP/RTP video, with a journal of what it was asked and faults on
// demand. On the wire it shares no code with the driver library, so that each checks the other.
#ifndef VIRTUAL_CAMERA_VIRTUAL_CAMERA_H_
#define VIRTUAL_CAMERA_VIRTUAL_CAMERA_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "virtual_camera/card/card.h"
#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/ptz/camera_pose.h"
#include "virtual_camera/ptz/ptz_head.h"
#include "virtual_camera/rtp/sent_log.h"
#include "virtual_camera/scene/alarm_scene.h"
#include "virtual_camera/server/journal.h"
#include "virtual_camera/values/options.h"

namespace vexa::camera {

class CameraCore;
class EventLoop;

// One camera and the thread that serves it. All operations may be called from any thread but the camera's own (the
// journal's observer runs on that one).
class VirtualCamera {
 public:
  explicit VirtualCamera(CameraOptions options);                          // on a thread of its own
  VirtualCamera(CameraOptions options, std::shared_ptr<EventLoop> loop);  // on a loop shared with other cameras
  ~VirtualCamera();                                                       // stops it
  VirtualCamera(const VirtualCamera&) = delete;
  VirtualCamera& operator=(const VirtualCamera&) = delete;

  // Opens both ports. On failure returns false, and error() has the reason.
  [[nodiscard]] bool start();
  // Closes every connection and session. The journal and the sent log stay readable. Harmless when not running.
  void stop();
  // Vanishes: every connection is reset, connecting is refused; back on the same ports after `away`, without sessions.
  void reboot(std::chrono::milliseconds away);
  // Pulls the network cable: as a reboot, but the camera runs on, and records when it is set to; until it is plugged.
  void unplug();
  void plug();

  // Sets its clock, as a power failure does that leaves it in 1970: for the card's recordings and the sender reports of
  // streams that begin afterwards.
  void set_clock(std::chrono::system_clock::time_point time);

  [[nodiscard]] const std::string& error() const { return error_; }
  [[nodiscard]] const std::string& address() const;
  [[nodiscard]] std::uint16_t http_port() const;  // valid after start()
  [[nodiscard]] std::uint16_t rtsp_port() const;
  [[nodiscard]] std::uint16_t control_port() const;  // 0 without one
  [[nodiscard]] std::size_t sessions() const;        // open RTSP sessions

  [[nodiscard]] SettingsStore& settings();
  [[nodiscard]] AlarmScene& alarms();
  [[nodiscard]] Card& card();
  // Its present direction; none for a camera that does not know it.
  [[nodiscard]] std::optional<CameraPose> pose() const;
  [[nodiscard]] PtzHead* ptz();  // null: the camera does not move
  [[nodiscard]] Journal& journal();
  [[nodiscard]] SentLog& sent();
  [[nodiscard]] const PacketisedClip* clip() const;  // the clip streamed; valid after start(), null when none

  // What a path of the control port makes happen, such as "/lens/cover"; the status of the answer (204, 400, 404).
  [[nodiscard]] std::string_view control(std::string_view path, std::string_view query = {});
  [[nodiscard]] bool plugged() const;
  [[nodiscard]] bool locked() const;          // after too many refused logins
  [[nodiscard]] std::size_t viewers() const;  // open RTSP sessions, and picture streams over HTTP
  [[nodiscard]] PacketFaults packet_faults() const;
  [[nodiscard]] std::size_t request_faults() const;  // how many are set

  void add_request_fault(RequestFault fault);
  void clear_request_faults();
  void set_packet_faults(PacketFaults faults);  // for sessions that start playing afterwards

 private:
  std::shared_ptr<EventLoop> loop_;
  std::shared_ptr<CameraCore> core_;
  std::string error_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VIRTUAL_CAMERA_H_

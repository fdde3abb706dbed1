// What the parts of one running camera share.
#ifndef VIRTUAL_CAMERA_SERVER_CAMERA_STATE_H_
#define VIRTUAL_CAMERA_SERVER_CAMERA_STATE_H_

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "virtual_camera/card/card.h"
#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/ptz/camera_pose.h"
#include "virtual_camera/ptz/ptz_head.h"
#include "virtual_camera/rtp/sent_log.h"
#include "virtual_camera/scene/alarm_scene.h"
#include "virtual_camera/scene/scene_stage.h"
#include "virtual_camera/server/event_loop.h"
#include "virtual_camera/server/journal.h"
#include "virtual_camera/server/request_faults.h"
#include "virtual_camera/values/options.h"

namespace vexa::camera {

class Connection;
class LiveVideo;
class RtspSession;

// Held by every connection, so it outlives the last of them. Members without a lock of their own belong to the loop's
// thread, once the camera has started.
struct CameraState {
  CameraState(CameraOptions camera_options, asio::io_context& loop_context)
      : options(std::move(camera_options)),
        context(loop_context),
        alarms(options.alarms),
        card(options.card_bytes),
        journal(options.journal_limit),
        sent(options.sent_log_limit),
        packet_faults(options.packet_faults),
        next_session(options.first_session) {
    for (const RequestFault& fault : options.request_faults) request_faults.add(fault);
    take_profile();
  }

  // Loads the profile that the options name; `profile_error` says why it could not be.
  void take_profile();
  // Puts the contacts into the settings, where the inquiry reads them.
  void report_contacts();
  // Puts the card's free space into the settings likewise.
  void report_card();
  // Puts presets and tours into the settings, likewise.
  void report_presets();
  // The picture by which hosts point.
  [[nodiscard]] PtzPicture ptz_picture() const;
  // The detectors are as the settings say, from now on.
  void switch_detectors();

  CameraOptions options;      // unchanged once the camera runs
  std::string profile_error;  // empty: none
  asio::io_context& context;
  AlarmScene alarms;
  std::string alarm_part;  // the newest that streams were told
  SceneStage stage;
  Card card;
  std::unique_ptr<PtzHead> ptz;  // null: nothing moves, or nothing is known of the model
  PoseSource pose;               // empty: the camera does not know where it looks
  SettingsStore settings;
  Journal journal;
  SentLog sent;
  RequestFaultList request_faults;
  std::mutex packet_faults_mutex;
  PacketFaults packet_faults;  // under packet_faults_mutex; options hold those given at the start
  std::vector<std::weak_ptr<Connection>> connections;
  std::map<std::uint32_t, std::shared_ptr<RtspSession>> sessions;
  std::map<int, std::weak_ptr<LiveVideo>> live;  // what renders a stream, while somebody watches it
  std::uint32_t next_session;
  std::uint64_t plays = 0;  // streams begun
  // Empty while the camera is stopped.
  std::function<void(std::chrono::milliseconds)> reboot;
  std::function<void(bool plugged)> set_network;
  std::function<void()> settings_changed;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_CAMERA_STATE_H_

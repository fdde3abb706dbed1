// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/camera_state.h"

#include <utility>
#include <variant>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/model/setting_rules.h"
#include "virtual_camera/server/http_commands.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

// Loads the profile that the options name, where they hold none. Returns why it could not be loaded; empty on success.
std::string load_profile(CameraOptions& options) {
  if (options.profile || options.profile_path.empty()) return {};
  auto loaded = load_camera_profile(options.profile_path);
  if (auto* error = std::get_if<std::string>(&loaded)) return std::move(*error);
  options.profile = std::make_shared<const SettingRules>(std::get<CameraProfile>(std::move(loaded)));
  return {};
}

AlarmLayout layout_of(const CameraOptions& options) {
  if (!options.profile) return options.alarms;
  const CameraProfile& model = options.profile->profile();
  return {model.alarm_inputs, model.video_detection, model.tampering_detection, model.audio_detection};
}

std::unique_ptr<PtzHead> head_of(const CameraOptions& options) {
  if (!options.profile || !options.profile->profile().ptz) return nullptr;
  return std::make_unique<PtzHead>(*options.profile->profile().ptz, std::chrono::steady_clock::now(),
                                   options.speed * options.ptz_speed);
}

PoseSource pose_of(PtzHead* ptz, const SettingsStore& settings) {
  if (ptz == nullptr) return nullptr;
  return [ptz, &settings](PtzHead::Time now) { return ptz->pose(pointed_picture(settings).turned, now); };
}

}  // namespace

CameraState::CameraState(CameraOptions camera_options, asio::io_context& loop_context)
    : options(std::move(camera_options)),
      profile_error(load_profile(options)),
      context(loop_context),
      alarms(layout_of(options)),
      card(options.card_bytes),
      ptz(head_of(options)),
      pose(pose_of(ptz.get(), settings)),
      scene(settings, alarms, stage, pose, ptz.get()),
      sources(options, settings, scene),
      logins(options.lock_after),
      journal(options.journal_limit),
      sent(options.sent_log_limit),
      packet_faults(options.packet_faults),
      next_session(options.first_session) {
  if (options.profile) settings.obey(options.profile);
  for (const RequestFault& fault : options.request_faults) request_faults.add(fault);
}

CameraState::~CameraState() = default;

std::size_t CameraState::viewers() {
  std::erase_if(picture_streams, [](const std::weak_ptr<HttpBody>& stream) { return stream.expired(); });
  return sessions.size() + picture_streams.size();
}

bool CameraState::lets_in(std::string_view authorization) {
  return logins.lets_in(credentials_match(authorization, options.user, options.password), wall_clock());
}

std::chrono::system_clock::time_point CameraState::wall_clock() const {
  return std::chrono::system_clock::now() + clock_ahead;
}

void CameraState::set_clock(std::chrono::system_clock::time_point time) {
  clock_ahead = time - std::chrono::system_clock::now();
}

}  // namespace vexa::camera

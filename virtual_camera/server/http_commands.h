// SPDX-License-Identifier: Apache-2.0
// The HTTP commands of a running camera, and what it keeps elsewhere and hosts read or change as settings.
#ifndef VIRTUAL_CAMERA_SERVER_HTTP_COMMANDS_H_
#define VIRTUAL_CAMERA_SERVER_HTTP_COMMANDS_H_

#include "virtual_camera/card/card.h"
#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/ptz/ptz_head.h"
#include "virtual_camera/scene/alarm_scene.h"
#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

// Obeys the command of a request whose credentials are right; 404 for a path that is no command. On the loop's thread.
[[nodiscard]] Answer obey_command(const RequestHead& head, CameraState& state);

// Each of the three puts the present state into its section, where the inquiry reads it; a camera without the section
// is left as it is.
void report_contacts(const AlarmScene& alarms, SettingsStore& settings);
void report_card(const Card& card, SettingsStore& settings);
void report_presets(PtzHead& ptz, SettingsStore& settings);

// Switches the detectors according to the settings.
void switch_detectors(const SettingsStore& settings, AlarmScene& alarms);

// The picture whose pixels hosts use to point the camera: that of the first stream.
[[nodiscard]] PtzPicture pointed_picture(const SettingsStore& settings);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_HTTP_COMMANDS_H_

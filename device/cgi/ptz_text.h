// SPDX-License-Identifier: Apache-2.0
// Scales of motion: the host's speeds, positions and picture coordinates in the camera's units.
#pragma once

#include <string_view>
#include <vector>

#include "device/cgi/words.h"
#include "vexa/ptz_info.h"

namespace vexa {

inline constexpr Word<ELibDPanTiltDirection> kDirectionWords[] = {
    {LIBD_DIRECTION_UP_LEFT, "up-left"},     {LIBD_DIRECTION_UP, "up"},     {LIBD_DIRECTION_UP_RIGHT, "up-right"},
    {LIBD_DIRECTION_LEFT, "left"},           {LIBD_DIRECTION_STOP, "stop"}, {LIBD_DIRECTION_RIGHT, "right"},
    {LIBD_DIRECTION_DOWN_LEFT, "down-left"}, {LIBD_DIRECTION_DOWN, "down"}, {LIBD_DIRECTION_DOWN_RIGHT, "down-right"}};

/// Whether a host's speed is in its range, -10000 to 10000.
bool is_host_speed(int speed);

/// Whether a host's position or picture coordinate is in its range, 0 to 10000.
bool is_host_position(int position);

/// Whether a picture has a size that coordinates can refer to.
bool has_size(const SLibDResolutionInfo& picture);

/// Speed of the continuous dialect: the host's divided by 100, with its sign.
int continuous_speed(int speed);

/// Speed of the move dialect on one axis: the share of the axis' largest, without a sign.
int move_speed(int speed, int largest);

/// The direction of these speeds; `direction` itself when both are 0.
ELibDPanTiltDirection direction_of(int pan, int tilt, ELibDPanTiltDirection direction);

/// The picture that an area request names.
inline constexpr char kAreaImage[] = "image1";

/// Speed of a move to a stored or given position: the smaller of both axes' largest.
int recall_speed(const SLibDFixedPanTiltInfo& camera);

/// The larger of both amounts.
int larger_amount(int pan, int tilt);

/// The value raised to `least`, then lowered to `most`. Unlike std::clamp it is defined for `least` above `most`, which
/// a profile may contain: `most` then wins.
int held_between(long long value, int least, int most);

/// The value at `amount`/10000 (its sign ignored) of the way from `least` to `most`, and within both.
int share_between(int amount, int least, int most);

/// A host's pan or tilt position in the camera's 16-bit units: half the span is the host's whole scale.
int axis_position(int position, int span, int origin);

/// A relative zoom step of -100 to 100 in the camera's 16-bit units: 4096 is the whole.
int zoom_step(int step);

/// A picture coordinate as the offset from the picture's centre, in pixels.
int centre_offset(int coordinate, int size);

/// The width or height of an area in pixels.
int area_extent(int extent, int size);

/// `count` presets without names, in order; none for a negative count.
std::vector<SLibDPresetInfo> unnamed_presets(int count);

/// Names presets by a list "NUMBER,NAME,NUMBER,NAME", numbers counted from 1. False when the list ends within a pair,
/// or at an empty piece or a number that no preset has; the names before it stand.
bool name_presets(std::string_view list, std::vector<SLibDPresetInfo>& presets);

}  // namespace vexa

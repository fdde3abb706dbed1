#include "virtual_camera/model/profile_ptz.h"

#include <cstdint>
#include <vector>

namespace vexa::camera {
namespace {

constexpr int kFastest = 10000;
constexpr int kMostUnits = 65536;  // of a position of pan and tilt
constexpr int kWidestAngle = 36000;
constexpr int kMostLensUnits = 65535;
constexpr std::size_t kMostZoomPoints = 64;

// What a model takes that does not say.
constexpr AxisTimes kPanTimes = {3600, 250};
constexpr AxisTimes kTiltTimes = {1500, 250};
constexpr AxisTimes kZoomTimes = {3000, 100};
constexpr AxisTimes kFocusTimes = {2000, 100};

AxisTimes times_of(const ProfilePlace& axis, AxisTimes times) {
  constexpr int kSlowest = 600000;
  if (const ProfilePlace travel = axis.optional("travelTime")) times.travel = travel.number(1, kSlowest);
  if (const ProfilePlace ramp = axis.optional("rampTime")) times.ramp = ramp.number(1, kSlowest);
  return times;
}

TurnProfile turn_of(const ProfilePlace& place, AxisTimes usual) {
  TurnProfile turn;
  turn.max_speed = place.required("maxSpeed").number(1, kFastest);
  const ProfilePlace span = place.required("span");
  turn.span = span.number(-2 * kMostUnits, 2 * kMostUnits);
  turn.angle_range = place.required("angleRange").number(1, kWidestAngle);
  const ProfilePlace origin = place.required("origin");
  turn.origin = origin.number(-kMostUnits, kMostUnits);
  turn.wide_angle = place.required("wideAngle").number(1, kWidestAngle);
  turn.times = times_of(place, usual);
  if (turn.span == 0) span.refuse("must not be 0: positions are angles by it");
  for (const int end : {turn.origin, turn.end()}) {
    if (end < INT16_MIN || end > INT16_MAX) origin.refuse("must keep both ends within -32768 to 32767");
  }
  return turn;
}

LensProfile lens_of(const ProfilePlace& place, AxisTimes usual) {
  LensProfile lens;
  lens.min_speed = place.required("minSpeed").number(1, kFastest);
  const ProfilePlace fastest = place.required("maxSpeed");
  lens.max_speed = fastest.number(1, kFastest);
  if (lens.max_speed < lens.min_speed) fastest.refuse("must not be below minSpeed");
  lens.min_position = place.required("minPosition").number(0, kMostLensUnits);
  const ProfilePlace farthest = place.required("maxPosition");
  lens.max_position = farthest.number(0, kMostLensUnits);
  if (lens.max_position < lens.min_position) farthest.refuse("must not be below minPosition");
  lens.times = times_of(place, usual);
  return lens;
}

std::vector<ZoomPoint> curve_of(const ProfilePlace& list) {
  std::vector<ZoomPoint> curve;
  for (const ProfilePlace& place : list.items(kMostZoomPoints)) {
    place.with_only({"ratio", "position"});
    const ProfilePlace ratio = place.required("ratio");
    const ProfilePlace position = place.required("position");
    const ZoomPoint point{ratio.number(1, 1000), position.number(0, kMostLensUnits)};
    if (!curve.empty() && point.position <= curve.back().position) position.refuse("must be above the one before it");
    if (!curve.empty() && point.ratio < curve.back().ratio) ratio.refuse("must not be below the one before it");
    curve.push_back(point);
  }
  return curve;
}

void read_lenses(const ProfilePlace& ptz, PtzProfile& profile) {
  const ProfilePlace zoom = ptz.required("zoom").with_only(
      {"minSpeed", "maxSpeed", "minPosition", "maxPosition", "ratios", "travelTime", "rampTime"});
  profile.zoom = lens_of(zoom, kZoomTimes);
  profile.ratios = curve_of(zoom.required("ratios"));
  const ProfilePlace focus =
      ptz.optional("focus").with_only({"minSpeed", "maxSpeed", "minPosition", "maxPosition", "travelTime", "rampTime"});
  if (focus) profile.focus = lens_of(focus, kFocusTimes);
}

}  // namespace

std::optional<PtzProfile> ptz_part(const ProfilePlace& ptz) {
  if (!ptz) return std::nullopt;
  ptz.with_only({"dialect", "noMoveSpeed", "pan", "tilt", "zoom", "focus", "presets", "tours", "shadowTours"});
  PtzProfile profile;
  profile.continuous = ptz.required("dialect").one_of({"continuous", "move"}) == "continuous";
  (void)ptz.optional("noMoveSpeed").flag();
  profile.pan = turn_of(ptz.required("pan").with_only(
                            {"maxSpeed", "span", "angleRange", "origin", "wideAngle", "travelTime", "rampTime"}),
                        kPanTimes);
  const ProfilePlace tilt = ptz.required("tilt").with_only(
      {"maxSpeed", "span", "angleRange", "origin", "wideAngle", "offset", "travelTime", "rampTime"});
  profile.tilt = turn_of(tilt, kTiltTimes);
  profile.tilt.offset = tilt.required("offset").number(-kMostUnits, kMostUnits);
  read_lenses(ptz, profile);
  profile.presets = ptz.optional("presets").number(0, 256);
  profile.tours = ptz.optional("tours").number(0, 5);
  profile.shadow_tours = ptz.optional("shadowTours").number(0, 5);
  return profile;
}

}  // namespace vexa::camera

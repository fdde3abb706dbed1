// Which sensors and detectors a camera has.
#ifndef VIRTUAL_CAMERA_VALUES_ALARM_LAYOUT_H_
#define VIRTUAL_CAMERA_VALUES_ALARM_LAYOUT_H_

#include <string>

namespace vexa::camera {

struct AlarmLayout {
  int inputs = 2;
  std::string detection = "object";  // "object", "motion" (both by window), "lod" (one item); empty: none
  bool tampering = true;
  bool audio = true;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_ALARM_LAYOUT_H_

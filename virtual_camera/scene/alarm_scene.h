// SPDX-License-Identifier: Apache-2.0
// What happens around the camera: contacts that close, a covered lens, noise, something that moves. It makes the parts
// of the alarm-data and motion-metadata streams.
#ifndef VIRTUAL_CAMERA_SCENE_ALARM_SCENE_H_
#define VIRTUAL_CAMERA_SCENE_ALARM_SCENE_H_

#include <array>
#include <cstddef>
#include <functional>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/values/options.h"

namespace vexa::camera {

// One thing that happens.
struct AlarmEvent {
  enum class Kind { kContact, kLens, kNoise, kMotion };

  Kind kind = Kind::kContact;
  int number = 1;  // of the contact or window
  int value = 0;   // 0: open, free, quiet, still
};

// Owned by the camera's state; thread-safe. Each change makes one part; a state that stays makes none.
class AlarmScene {
 public:
  static constexpr std::size_t kWindows = 4;
  using Listener = std::function<void(const std::string& part)>;

  explicit AlarmScene(AlarmLayout layout) { rearrange(std::move(layout)); }

  // Other sensors and detectors, all at rest; before anybody listens.
  void rearrange(AlarmLayout layout);
  // Called with the part of every change, on the thread that makes it. Empty: nobody listens.
  // Returns the part of what holds now, before the first of them.
  std::string listen(Listener listener);

  // False for a contact or window that the camera does not have.
  bool happen(const AlarmEvent& event);
  // Whether the detectors are switched on; off, they report no alarm.
  void switch_detectors(bool tampering, bool audio);
  // The camera forgets the tampering alarm until the lens is covered anew.
  void clear_tampering();
  [[nodiscard]] bool lens_covered() const;
  // The kind of detection that the layout names.
  [[nodiscard]] std::string detection() const;

  [[nodiscard]] std::string metadata_part() const;
  // State by contact, 1 for a closed one.
  [[nodiscard]] std::vector<int> contacts() const;

 private:
  [[nodiscard]] std::string part_locked() const;
  template <typename Value>
  void change(Value& value, Value next);

  mutable std::mutex mutex_;
  AlarmLayout layout_;
  Listener listener_;
  std::vector<int> contacts_;
  std::array<int, kWindows> motion_{};
  bool covered_ = false;
  bool tampered_ = false;
  bool noise_ = false;
  bool tampering_on_ = false;
  bool audio_on_ = false;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SCENE_ALARM_SCENE_H_

// SPDX-License-Identifier: Apache-2.0
// Locks everyone out after too many refused logins, as cameras do against guessing.
#ifndef VIRTUAL_CAMERA_MODEL_LOGIN_GUARD_H_
#define VIRTUAL_CAMERA_MODEL_LOGIN_GUARD_H_

#include <chrono>

namespace vexa::camera {

class LoginGuard {
 public:
  using Time = std::chrono::system_clock::time_point;
  static constexpr std::chrono::minutes kLock{30};

  // `most` refused logins in a row lock; 0: none ever do.
  explicit LoginGuard(unsigned most) : most_(most) {}

  // Whether a request is let in at `now`, which is the camera's own clock; while it is locked none is, whose
  // credentials are right included.
  [[nodiscard]] bool lets_in(bool right, Time now);
  [[nodiscard]] bool is_locked(Time now) const { return now < locked_until_; }

 private:
  unsigned most_;
  unsigned refused_ = 0;  // in a row
  Time locked_until_ = Time::min();
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_LOGIN_GUARD_H_

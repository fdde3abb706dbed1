// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/model/login_guard.h"

namespace vexa::camera {

bool LoginGuard::lets_in(bool right, Time now) {
  if (is_locked(now)) return false;
  refused_ = right ? 0 : refused_ + 1;
  if (most_ != 0 && refused_ == most_) {
    locked_until_ = now + kLock;
    refused_ = 0;
  }
  return right;
}

}  // namespace vexa::camera

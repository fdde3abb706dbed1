// SPDX-License-Identifier: Apache-2.0
#include "session/core/admission.h"

#include <algorithm>

namespace vexa {

bool Admission::enter(std::uint64_t session) {
  if (inside_.count(session) != 0) return true;
  const bool queued = std::find(queue_.begin(), queue_.end(), session) != queue_.end();
  if (!queued) queue_.push_back(session);
  if (inside_.size() >= most_ || queue_.front() != session) return false;
  queue_.pop_front();
  inside_.insert(session);
  return true;
}

void Admission::leave(std::uint64_t session) {
  inside_.erase(session);
  queue_.erase(std::remove(queue_.begin(), queue_.end(), session), queue_.end());
}

std::uint64_t Admission::admit_next() {
  if (queue_.empty() || inside_.size() >= most_) return 0;
  const std::uint64_t session = queue_.front();
  queue_.pop_front();
  inside_.insert(session);
  return session;
}

}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
#include "session/core/back_off.h"

#include <algorithm>

namespace vexa {

Moment BackOff::next(double chance) {
  const double share = chance > 0 ? std::min(chance, 1.0) : 0.0;
  const auto span = static_cast<double>((limit_ - kLeast).count());
  limit_ = std::min(limit_ * 2, kLastLimit);
  return kLeast + Moment(static_cast<Moment::rep>(share * span));
}

bool BackOff::prove(Moment since, Moment now) {
  if (now - since < kProof) return false;
  reset();
  return true;
}

}  // namespace vexa

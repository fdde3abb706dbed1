#include "transport/failure.h"

#include <cstring>

namespace vexa {

Failure system_failure(int error) {
  char text[256];
  // The GNU form: returns where the text is.
  return {LIBD_FAILED, strerror_r(error, text, sizeof text)};
}

Failure wait_failure(int answer, const KnownFailure& expired) {
  if (answer == 0) return expired;
  if (answer == -1) return system_failure();
  return kStrangeStatus;
}

}  // namespace vexa

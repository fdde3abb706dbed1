// The latest failed operation, as hosts read it.
#include <cstddef>

#include "device/driver_state.h"
#include "runtime/base/result.h"
#include "vexa/failure.h"

namespace vexa {

void GetLastFailure(CVexaCommon& driver, FailureReport& report) noexcept {
  FailureReport last;
  DriverState::of(driver).errors.with_last([&](const FailedOperation& failed) {
    last.code = failed.code;
    last.cancelled = failed.cancelled;
    const bool fitted = within_memory([&] {
      last.text = failed.text;
      last.operation = failed.name;
      last.camera = failed.camera;
    });
    if (fitted) return;
    last.text.clear();
    last.operation.clear();
    last.camera.clear();
  });
  last.size = report.size;
  report = std::move(last);
}

const char* CodeName(ELibDReturnCode code) noexcept {
  switch (code) {
    case LIBD_OK:
      return "LIBD_OK";
    case LIBD_FAILED:
      return "LIBD_FAILED";
    case LIBD_NOT_SUPPORTED:
      return "LIBD_NOT_SUPPORTED";
    case LIBD_INVALID_ARGUMENT:
      return "LIBD_INVALID_ARGUMENT";
    case LIBD_INVALID_MODE:
      return "LIBD_INVALID_MODE";
    case LIBD_STREAM_OPEN_FAILED:
      return "LIBD_STREAM_OPEN_FAILED";
    case LIBD_TIMEOUT:
      return "LIBD_TIMEOUT";
    case LIBD_UNAUTHORIZED:
      return "LIBD_UNAUTHORIZED";
    case LIBD_NO_FRAME:
      return "LIBD_NO_FRAME";
    case LIBD_FRAME_DAMAGED:
      return "LIBD_FRAME_DAMAGED";
    case LIBD_BUFFER_TOO_SMALL:
      return "LIBD_BUFFER_TOO_SMALL";
  }
  return "unknown";
}

}  // namespace vexa

// The choice of a video stream.
#include "vexa/stream_choice.h"

#include "device/driver_state.h"

namespace vexa {

ELibDReturnCode SelectStream(CVexaCommon& driver, int stream) noexcept {
  DriverState& state = DriverState::of(driver);
  const Operation operation(state, "SelectStream");
  return state.errors.run([&]() -> Outcome {
    if (stream < 1) return LIBD_INVALID_ARGUMENT;
    std::string answer;
    if (const auto asked = state.camera.inquire("camera", answer); asked != LIBD_OK) return asked;
    return state.choose_stream(answer, stream);
  });
}

}  // namespace vexa

// Whose packets a driver takes.
#include "vexa/reception.h"

#include "device/driver_state.h"

namespace vexa {

void SetStrictReception(CVexaCommon& driver, bool on) { DriverState::of(driver).strict_reception = on; }

}  // namespace vexa

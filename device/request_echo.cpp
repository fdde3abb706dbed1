// SPDX-License-Identifier: Apache-2.0
#include "device/request_echo.h"

#include <cstdio>

#include "device/driver_state.h"
#include "runtime/base/result.h"
#include "runtime/base/text.h"
#include "runtime/base/wipe.h"
#include "vexa/trace.h"

namespace vexa {

void RequestEcho::write(const std::string& line, const char* credentials) {
  std::shared_ptr<const Receiver> receiver;
  {
    const Guard guard(lock_);
    receiver = receiver_;
  }
  if (receiver == nullptr) std::puts(line.c_str());
  if (receiver == nullptr && !recorder_.is_on()) return;
  std::string shown = masked(line, credentials);
  const WipedAtEnd wiped(shown);  // what was masked may stand after its end
  if (receiver != nullptr) (*receiver)(shown.c_str());
  if (!recorder_.is_on()) return;
  Operation::announce(recorder_);
  recorder_.note("rtsp >", shown);
}

void RequestEcho::answered(const std::string& answer, const char* credentials) {
  if (recorder_.is_on()) recorder_.note("rtsp <", masked(answer, credentials));
}

void RequestEcho::use(std::shared_ptr<const Receiver> receiver) {
  const Guard guard(lock_);
  receiver_.swap(receiver);
}

bool SetTrace(CVexaCommon& driver, std::function<void(const char* line)> trace) noexcept {
  return within_memory([&] {
    std::shared_ptr<const RequestEcho::Receiver> receiver;
    if (trace) receiver = std::make_shared<const RequestEcho::Receiver>(std::move(trace));
    DriverState::of(driver).echo.use(std::move(receiver));
  });
}

}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
// A session's states under any order of events: two bytes each, an event and how much time has passed before it.
#include <string>

#include "fuzz/check.h"
#include "runtime/base/bytes.h"
#include "session/core/session_machine.h"

namespace {

using vexa::Moment;
using vexa_fuzz::check;
using State = vexa::SessionState;

/// A keeper that does what a machine allows, as the input has it.
class Keeper {
 public:
  void step(unsigned event, Moment passed) {
    now_ += passed;
    const std::uint64_t before = machine_.status().event;
    const bool was_over = machine_.is_over();
    take(event);
    check(machine_.status().event >= before);
    check(!was_over || (machine_.is_over() && machine_.status().event == before));
    check(machine_.status().since <= now_.count());
    check(machine_.status().state != State::kLive || open_);
    check(machine_.status().nextAttempt == 0 || machine_.status().state == State::kWaiting ||
          machine_.status().state == State::kRefused || machine_.status().state == State::kConnecting);
  }

 private:
  void close_if(bool wanted) {
    if (!wanted) return;
    open_ = connecting_ = false;
    machine_.closed(now_);
  }

  void take(unsigned event) {
    const double chance = static_cast<double>(event >> 4) / 16;
    switch (event % 14) {
      case 0:
        if (!started_) machine_.start(now_);
        started_ = true;
        return;
      case 1:
        if (!started_) return;
        machine_.stop(now_);
        if (!connecting_ && !open_) return;
        return close_if(true);
      case 2:
        if (started_) machine_.retry(now_);
        return;
      case 3:
        if (!machine_.is_due(now_) || open_ || connecting_) return;
        machine_.connecting(now_);
        connecting_ = true;
        return;
      case 4:
        if (!machine_.is_due(now_) || open_ || connecting_) return;
        return machine_.hold(vexa::SessionCause::kTurn, now_ + Moment(1000), now_);
      case 5:
        if (!connecting_) return;
        connecting_ = false;
        open_ = true;
        return machine_.opened(now_);
      case 6:
        if (!connecting_ && !open_) return;
        machine_.failed(LIBD_TIMEOUT, "timed out", chance, now_);
        return close_if(true);
      case 7:
        if (!connecting_ && !open_) return;
        machine_.refused_credentials(LIBD_UNAUTHORIZED, "Unauthorized", vexa::kNever, now_);
        return close_if(true);
      case 8:
        return machine_.credentials_changed(now_);
      case 9:
      case 10:
        if (open_) machine_.picture(now_);
        return;
      case 11:
        if (open_) machine_.stream_changed(now_);
        return;
      case 12:
        return close_if(machine_.link_back(now_) && (open_ || connecting_));
      default:
        return close_if(machine_.is_hopeless(chance, now_) && (open_ || connecting_));
    }
  }

  vexa::SessionMachine machine_{true, {}};
  Moment now_{1000};
  bool started_ = false;
  bool connecting_ = false;
  bool open_ = false;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  vexa::ByteReader in({data, size});
  Keeper keeper;
  while (in.rest().size() >= 2) {
    const unsigned event = in.u8();
    const std::uint8_t passed = in.u8();
    keeper.step(event, Moment(static_cast<std::int64_t>(passed) * passed));
  }
  return 0;
}

// SPDX-License-Identifier: Apache-2.0
// Credentials and turns of many sessions under any order of events: never two trials of unknown credentials at once,
// none after a refusal, never more sessions inside than there is room for, and all in the order in which they came.
#include <algorithm>
#include <deque>
#include <set>
#include <string>

#include "fuzz/check.h"
#include "runtime/base/bytes.h"
#include "session/core/admission.h"
#include "session/core/back_off.h"
#include "session/core/credential_breaker.h"

namespace {

using vexa::Moment;
using vexa_fuzz::check;
using Answer = vexa::CredentialBreaker::Answer;

class Trials {
 public:
  void step(unsigned event, Moment now) {
    switch (event % 8) {
      case 0:
      case 1:
        return ask(now);
      case 2:
        if (!trying_) return;
        good_ = true;
        trying_ = refused_ = false;
        return breaker_.accepted();
      case 3:
        if (!trying_) return;
        trying_ = false;
        refused_ = true;
        return breaker_.refused(now);
      case 4:
        if (trying_) breaker_.abandoned();
        trying_ = false;
        return;
      case 5:
        return breaker_.doubt();
      case 6:
        refused_ = false;
        return breaker_.retry();
      default:
        breaker_.set_password(std::string(1, static_cast<char>('a' + event / 64)));
        if (password_ == event / 64) return;
        password_ = event / 64;
        trying_ = refused_ = good_ = false;
    }
  }

 private:
  void ask(Moment now) {
    const Answer answer = breaker_.ask(now);
    check(answer != Answer::kTry || !trying_);
    check(answer != Answer::kGo || good_);
    check(!refused_ || good_ || answer == Answer::kRefused);
    check(!refused_ || !good_ || answer == Answer::kWait || now >= Moment(60000));
    trying_ = trying_ || answer == Answer::kTry;
  }

  vexa::CredentialBreaker breaker_;
  unsigned password_ = 255;
  bool good_ = false;
  bool refused_ = false;
  bool trying_ = false;
};

class Turns {
 public:
  void step(unsigned event) {
    const std::uint64_t session = 1 + event / 4 % 32;
    switch (event % 4) {
      case 0:
      case 1:
        if (inside_.count(session) == 0 && !is_queued(session)) queue_.push_back(session);
        if (turns_.enter(session)) go_in(session);
        break;
      case 2:
        turns_.leave(session);
        inside_.erase(session);
        std::erase(queue_, session);
        break;
      default:
        if (const std::uint64_t next = turns_.admit_next(); next != 0) go_in(next);
    }
    check(turns_.inside() == inside_.size() && turns_.waiting() == queue_.size() && inside_.size() <= kMost);
  }

 private:
  static constexpr std::size_t kMost = 3;

  bool is_queued(std::uint64_t session) const {
    return std::find(queue_.begin(), queue_.end(), session) != queue_.end();
  }
  void go_in(std::uint64_t session) {
    if (!inside_.insert(session).second) return;
    check(!queue_.empty() && queue_.front() == session);
    queue_.pop_front();
  }

  vexa::Admission turns_{kMost};
  std::deque<std::uint64_t> queue_;
  std::set<std::uint64_t> inside_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Trials trials;
  Turns turns;
  vexa::BackOff back_off;
  Moment now{0};
  for (const std::uint8_t event : vexa::Bytes(data, size)) {
    now += Moment(event * 10);
    trials.step(event, now);
    turns.step(event);
    const Moment limit = back_off.limit();
    const Moment wait = back_off.next(static_cast<double>(event) / 200);
    check(wait >= vexa::BackOff::kLeast && wait <= limit && back_off.limit() <= vexa::BackOff::kLastLimit);
    if (event % 16 == 0) back_off.reset();
  }
  return 0;
}

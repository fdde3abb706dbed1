// SPDX-License-Identifier: Apache-2.0
#include "session/core/credential_breaker.h"

#include <algorithm>
#include <array>
#include <chrono>

namespace vexa {
namespace {

using std::chrono::minutes;

constexpr std::array<Moment, 5> kWaits = {minutes(1), minutes(5), minutes(15), minutes(30), minutes(60)};

}  // namespace

void CredentialBreaker::set_password(const std::string& password) {
  if (password == password_) return;
  *this = CredentialBreaker();
  password_ = password;
}

CredentialBreaker::Answer CredentialBreaker::ask(Moment now) {
  if (confirmed_) return Answer::kGo;
  if (refused_ && retry_at_ == kNever) return Answer::kRefused;
  if (trying_ || (refused_ && now < retry_at_)) return Answer::kWait;
  trying_ = true;
  return Answer::kTry;
}

void CredentialBreaker::accepted() {
  known_good_ = confirmed_ = true;
  refused_ = trying_ = false;
  refusals_ = 0;
  retry_at_ = kNever;
}

void CredentialBreaker::refused(Moment now) {
  // Requests that were on their way when the first was refused count as one with it.
  const bool again = refused_ && !trying_;
  trying_ = confirmed_ = false;
  refused_ = true;
  if (again) return;
  retry_at_ = known_good_ ? now + kWaits[std::min(refusals_, kWaits.size() - 1)] : kNever;
  ++refusals_;
}

void CredentialBreaker::retry() {
  if (!refused_) return;
  refused_ = false;
  retry_at_ = kNever;
}

}  // namespace vexa

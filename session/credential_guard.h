// SPDX-License-Identifier: Apache-2.0
// The breakers of the process, one for each camera address and user.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "session/core/credential_breaker.h"
#include "vexa/system_info.h"

namespace vexa {

/// Somebody who waits for a change of a guard: called by whichever thread makes it, with no lock held.
class CredentialWaiter {
 public:
  virtual void credentials_changed() = 0;

 protected:
  ~CredentialWaiter() = default;
};

/// A breaker with the password that it judges. Any thread.
class CredentialGuard {
 public:
  /// That of a camera's address and user, the same for all who ask while one of them holds it; and for as long as its
  /// credentials are refused, so that a host which begins a session anew does not send them again.
  static std::shared_ptr<CredentialGuard> of(const SLibDConnectionInfo& connection);

  void add_waiter(const std::weak_ptr<CredentialWaiter>& waiter);

  void set_password(const std::string& password);
  [[nodiscard]] std::string password() const;
  [[nodiscard]] CredentialBreaker::Answer ask(Moment now);
  void accepted();
  void refused(Moment now);
  void doubt();
  void abandoned();
  void retry();
  [[nodiscard]] Moment retry_at() const;
  [[nodiscard]] bool is_refused() const;

 private:
  template <typename Change>
  void change(const Change& change);

  mutable std::mutex mutex_;
  CredentialBreaker breaker_;
  std::string password_;
  std::vector<std::weak_ptr<CredentialWaiter>> waiters_;
};

}  // namespace vexa

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

/// What a guard answers who asks it, all of one moment.
struct CredentialTicket {
  CredentialBreaker::Answer answer = CredentialBreaker::Answer::kWait;
  std::string password;
  std::uint64_t generation = 0;  ///< of the password: what comes of a request is reported with it
  bool is_refused = false;       ///< the credentials wait for a next try, and nobody makes one now
  Moment next = kNever;          ///< that next try, later than now; kNever when none is planned
};

/// A breaker with the password that it judges. Any thread.
class CredentialGuard {
 public:
  /// That of a camera's address and user, the same for all who ask while one of them holds it; and for as long as its
  /// credentials are refused, so that a host which begins a session anew does not send them again.
  static std::shared_ptr<CredentialGuard> of(const SLibDConnectionInfo& connection);

  void add_waiter(const std::weak_ptr<CredentialWaiter>& waiter);

  void set_password(const std::string& password);
  [[nodiscard]] CredentialTicket ask(Moment now);
  /// What came of a request; nothing changes when its password has been replaced since.
  void accepted(std::uint64_t generation);
  void refused(std::uint64_t generation, Moment now);
  void abandoned(std::uint64_t generation);
  void doubt();
  void retry();
  /// When credentials that were refused may be sent again: now, if others are due or they are refused no more.
  [[nodiscard]] Moment next_try(std::uint64_t generation, Moment now) const;
  [[nodiscard]] bool is_current(std::uint64_t generation) const;
  [[nodiscard]] bool is_refused() const;

 private:
  template <typename Change>
  void change(const Change& change);
  /// Takes what came of a request of this generation.
  template <typename Verdict>
  void judge(std::uint64_t generation, const Verdict& verdict);

  mutable std::mutex mutex_;
  CredentialBreaker breaker_;
  std::string password_;
  std::uint64_t generation_ = 0;
  std::vector<std::weak_ptr<CredentialWaiter>> waiters_;
};

/// Credentials that are sent, and who hears what came of it.
struct CredentialTrial {
  std::shared_ptr<CredentialGuard> judge;
  std::uint64_t generation = 0;
};

}  // namespace vexa

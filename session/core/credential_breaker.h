// SPDX-License-Identifier: Apache-2.0
// Keeps refused credentials from locking a camera's account.
#pragma once

#include <cstddef>
#include <string>

#include "session/core/moment.h"

namespace vexa {

/// One for each camera address and user of the process. Requests carry the credentials at once, so that each one that
/// is refused is a failed login, and cameras lock an account after a few.
///
/// While it is not known whether the camera takes the credentials, one holder at a time may try them, and all others
/// wait for what comes of it. Credentials that never worked stop with the first refusal. Those that worked before are
/// tried again after 1, 5, 15, 30 and then every 60 minutes, by one request.
class CredentialBreaker {
 public:
  enum class Answer {
    kGo,       ///< the camera takes these credentials
    kTry,      ///< this holder tries them, with its cheapest request, and reports what came of it
    kWait,     ///< another holder is trying them, or it is not time yet: see retry_at()
    kRefused,  ///< refused until the password changes or retry() is called
  };

  /// Other credentials than those before are unknown again.
  void set_password(const std::string& password);
  [[nodiscard]] Answer ask(Moment now);
  /// What came of a request that was sent after kGo or kTry.
  void accepted();
  void refused(Moment now);
  /// A connection that used them has ended: they may have changed meanwhile, and one holder finds out.
  void doubt() { confirmed_ = false; }
  /// A try that ended before the camera had judged the credentials, for instance without an answer.
  void abandoned() { trying_ = false; }
  /// The host wants one more try, now.
  void retry();

  /// While refused: when the next try is due; kNever when none is.
  [[nodiscard]] Moment retry_at() const { return retry_at_; }
  [[nodiscard]] bool is_refused() const { return refused_; }

 private:
  std::string password_;
  bool known_good_ = false;  ///< accepted since the password was set
  bool confirmed_ = false;   ///< known good, and neither refused nor in doubt since
  bool refused_ = false;
  bool trying_ = false;
  std::size_t refusals_ = 0;  ///< since they were last accepted
  Moment retry_at_ = kNever;
};

}  // namespace vexa

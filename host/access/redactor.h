// SPDX-License-Identifier: Apache-2.0
// Keeps the password out of everything that vexactl prints for others: the driver's trace, a camera's answers.
#ifndef HOST_ACCESS_REDACTOR_H_
#define HOST_ACCESS_REDACTOR_H_

#include <string>
#include <string_view>
#include <vector>

#include "host/access/credentials.h"

namespace vexa::host {

// Replaces the password in texts. Holds a copy of it; immutable after construction, so any thread may use it.
class Redactor {
 public:
  Redactor() = default;
  explicit Redactor(const Credentials& credentials);

  // The text with "***" for the password, for the credentials as they travel (Base64), and for the value of every
  // Basic authorization, also one that is not this user's.
  [[nodiscard]] std::string operator()(std::string_view text) const;

 private:
  std::vector<std::string> secrets_;  // the longest first
};

}  // namespace vexa::host

#endif  // HOST_ACCESS_REDACTOR_H_

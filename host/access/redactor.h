// Keeps the password out of everything that vexactl prints on behalf of others.
#ifndef HOST_ACCESS_REDACTOR_H_
#define HOST_ACCESS_REDACTOR_H_

#include <string>
#include <string_view>
#include <vector>

#include "host/access/credentials.h"

namespace vexa::host {

class Redactor {
 public:
  Redactor() = default;
  explicit Redactor(const Credentials& credentials);

  // The text with "***" for the password, for the credentials as they travel (Base64), and for the value of every
  // Basic authorization, whoever's it is.
  [[nodiscard]] std::string operator()(std::string_view text) const;

 private:
  std::vector<std::string> secrets_;  // the longest first
};

}  // namespace vexa::host

#endif  // HOST_ACCESS_REDACTOR_H_

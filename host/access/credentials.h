// SPDX-License-Identifier: Apache-2.0
// User name and password: from files and the environment, never from the command line itself, where every user of the
// machine could read the password.
#ifndef HOST_ACCESS_CREDENTIALS_H_
#define HOST_ACCESS_CREDENTIALS_H_

#include <optional>
#include <string>
#include <string_view>

#include "host/base/problem.h"

namespace vexa::host {

struct Credentials {
  std::string user;
  std::string password;
};

inline constexpr char kUserVariable[] = "VEXACTL_USER";
inline constexpr char kPasswordVariable[] = "VEXACTL_PASSWORD";

struct CredentialSources {
  std::optional<std::string> user = {};              // --user
  std::optional<std::string> password_file = {};     // --password-file: the password is its first line
  std::optional<std::string> credentials_file = {};  // --credentials: its first line is USER:PASSWORD
  std::optional<std::string> environment_user = {};
  std::optional<std::string> environment_password = {};
};

// The value in "NAME=value" where that is the variable's name.
[[nodiscard]] std::optional<std::string> variable_value(std::string_view variable, std::string_view name);

// Fills the two environment sources from a process environment ("NAME=value" texts, null at the end).
void read_environment(CredentialSources& sources, const char* const* environment);

// Options win over the environment; what neither gives is empty. Refusals name files and options, never their contents.
[[nodiscard]] Result<Credentials> load_credentials(const CredentialSources& sources);

}  // namespace vexa::host

#endif  // HOST_ACCESS_CREDENTIALS_H_

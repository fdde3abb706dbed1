// SPDX-License-Identifier: Apache-2.0
#include "host/access/credentials.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <string_view>

#include "host/base/unique_fd.h"

namespace vexa::host {
namespace {

// The driver sends at most this much of "user:password" and would cut the rest without a report.
constexpr std::size_t kLongestCredentials = 255;
constexpr std::size_t kLargestFile = 4096;

Result<std::string> read_first_line(const std::string& path) {
  const UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file.valid()) return fail(unreadable(path, errno));
  std::string text;
  std::array<char, 512> piece{};
  while (text.size() <= kLargestFile && text.find('\n') == std::string::npos) {
    const ssize_t count = read_some(file.get(), piece.data(), piece.size());
    if (count < 0) return fail(unreadable(path, errno));
    if (count == 0) break;
    text.append(piece.data(), static_cast<std::size_t>(count));
  }
  text.resize(std::min(text.find('\n'), text.size()));
  if (!text.empty() && text.back() == '\r') text.pop_back();
  return text;
}

std::optional<Problem> apply_credentials_file(const std::string& path, Credentials& credentials) {
  const Result<std::string> text = read_first_line(path);
  if (!text) return text.error();
  const std::size_t colon = text->find(':');
  if (colon == std::string::npos) {
    return usage(fmt::format("the first line of {} is not USER:PASSWORD", path),
                 "Write both on one line, with a colon between them.");
  }
  credentials = {text->substr(0, colon), text->substr(colon + 1)};
  return std::nullopt;
}

std::optional<Problem> apply_password_file(const std::string& path, Credentials& credentials) {
  Result<std::string> line = read_first_line(path);
  if (!line) return line.error();
  credentials.password = *line;
  return std::nullopt;
}

std::optional<Problem> check(const Credentials& credentials) {
  if (credentials.user.find(':') != std::string::npos) {
    return usage("a user name cannot hold a colon", "A password goes into --password-file or --credentials.");
  }
  const std::string_view nul("\0", 1);
  if (credentials.user.find(nul) != std::string::npos || credentials.password.find(nul) != std::string::npos) {
    return usage("user name and password cannot hold a NUL character", "Check the file they come from.");
  }
  if (credentials.user.size() + 1 + credentials.password.size() > kLongestCredentials) {
    return usage(fmt::format("user name and password are longer than {} characters together", kLongestCredentials - 1),
                 "Choose shorter ones on the camera.");
  }
  return std::nullopt;
}

}  // namespace

std::optional<std::string> variable_value(std::string_view variable, std::string_view name) {
  if (variable.size() <= name.size() || !variable.starts_with(name) || variable[name.size()] != '=') {
    return std::nullopt;
  }
  return std::string(variable.substr(name.size() + 1));
}

void read_environment(CredentialSources& sources, const char* const* environment) {
  for (; *environment != nullptr; ++environment) {
    if (auto user = variable_value(*environment, kUserVariable)) sources.environment_user = std::move(user);
    if (auto password = variable_value(*environment, kPasswordVariable))
      sources.environment_password = std::move(password);
  }
}

Result<Credentials> load_credentials(const CredentialSources& sources) {
  Credentials credentials{sources.environment_user.value_or(""), sources.environment_password.value_or("")};
  std::optional<Problem> problem;
  if (sources.credentials_file) problem = apply_credentials_file(*sources.credentials_file, credentials);
  if (!problem && sources.user) credentials.user = *sources.user;
  if (!problem && sources.password_file) problem = apply_password_file(*sources.password_file, credentials);
  if (!problem) problem = check(credentials);
  if (problem) return fail(*std::move(problem));
  return credentials;
}

}  // namespace vexa::host

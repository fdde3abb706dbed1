// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/http_request.h"

#include <utility>

#include "runtime/base/base64.h"
#include "runtime/base/wipe.h"

namespace vexa {
namespace {

constexpr std::size_t kCredentialsRoom = 256;

template <typename Predicate>
std::string encoded_where(std::string_view text, Predicate must_be) {
  constexpr std::string_view kDigits = "0123456789ABCDEF";
  std::string encoded;
  for (const char c : text) {
    if (!must_be(c)) {
      encoded += c;
      continue;
    }
    const auto byte = static_cast<unsigned char>(c);
    encoded += {'%', kDigits[byte >> 4], kDigits[byte & 0xf]};
  }
  return encoded;
}

}  // namespace

std::string joined_credentials(const std::string& user, const std::string& password) {
  return format_within(kCredentialsRoom, "%s:%s", user.c_str(), password.c_str()).text;
}

std::string basic_credentials(const std::string& user, const std::string& password) {
  std::string joined = joined_credentials(user, password);
  const WipedAtEnd wiped(joined);
  return base64_encode(joined);
}

std::string without_credentials(std::string text, const std::string& user, const std::string& password) {
  if (password.empty()) return text;
  std::string as_sent = basic_credentials(user, password);
  const WipedAtEnd wiped(as_sent);
  return masked(masked(std::move(text), as_sent), password);
}

Formatted http_get_request(const HttpTarget& target) {
  return format_within(kRequestRoom, "GET http://%s:%d%s HTTP/1.0\r\nAuthorization: Basic %s\r\n\r\n",
                       target.host.c_str(), target.port, target.path.c_str(), target.credentials.c_str());
}

std::string percent_encoded(std::string_view text, std::string_view spared) {
  return encoded_where(
      text, [spared](char c) { return !is_ascii_alphanumeric(c) && spared.find(c) == std::string_view::npos; });
}

std::string as_one_word(std::string_view text, std::string_view also) {
  constexpr unsigned char kDelete = 0x7f;
  return encoded_where(text, [also](char c) {
    const auto byte = static_cast<unsigned char>(c);
    return byte <= ' ' || byte == kDelete || also.find(c) != std::string_view::npos;
  });
}

}  // namespace vexa

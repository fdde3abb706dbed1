// SPDX-License-Identifier: Apache-2.0
// The driver's HTTP requests.
#pragma once

#include <string>
#include <string_view>

#include "runtime/base/text.h"

namespace vexa {

/// Room for a request, its path or its URL, the terminator among it.
inline constexpr std::size_t kRequestRoom = 1024;

/// User and password joined for Basic authorisation (RFC 7617) before their encoding: cut at 255 characters.
std::string joined_credentials(const std::string& user, const std::string& password);

/// The same as requests carry them, in Base64. Secret, as what they are made of: its owner wipes it.
std::string basic_credentials(const std::string& user, const std::string& password);

/// The text without the password, plain or as requests carry it.
std::string without_credentials(std::string text, const std::string& user, const std::string& password);

/// What one request names.
struct HttpTarget {
  const std::string& host;  ///< the camera's, also when a proxy carries the request
  int port;
  const std::string& path;
  const std::string& credentials;
};

/// The whole GET request; cut when it does not fit.
Formatted http_get_request(const HttpTarget& target);

/// Percent-encodes every byte but ASCII letters and digits and the characters in `spared`.
std::string percent_encoded(std::string_view text, std::string_view spared);

/// Percent-encodes whatever would end a word of a request (blanks, control characters) and the characters in `also`;
/// all other bytes stay.
std::string as_one_word(std::string_view text, std::string_view also);

}  // namespace vexa

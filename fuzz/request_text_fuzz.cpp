// SPDX-License-Identifier: Apache-2.0
// Requests made of any texts: credentials are read back by another reader of Basic authorisation, names by another
// decoder, and none of them adds a line to a request.
#include <string>
#include <vector>

#include "fuzz/check.h"
#include "runtime/base/base64.h"
#include "runtime/base/text.h"
#include "transport/wire/http_request.h"
#include "virtual_camera/wire/message.h"

namespace {

using vexa_fuzz::check;

void encode_names(const std::string& text) {
  const std::string encoded = vexa::percent_encoded(text, "");
  const auto decoded = vexa::camera::percent_decoded(encoded);
  check(decoded && *decoded == text);
  const std::string word = vexa::as_one_word(text, "&,");
  check(word.find_first_of("\r\n \t&,") == std::string::npos && word.find('\0') == std::string::npos);
}

void encode_credentials(const std::string& text) {
  const std::string encoded = vexa::base64_encode(text);
  check(encoded == vexa::camera::base64_text(text));
  const std::vector<unsigned char> decoded = vexa::base64_decode(encoded);
  check(decoded.size() >= text.size() && std::string(decoded.begin(), decoded.end()).starts_with(text));
  static_cast<void>(vexa::base64_decode(text));
}

void ask_with(const std::string& text) {
  const std::string user(vexa::before_nul(text));
  const std::string password = text.size() > user.size() ? text.substr(user.size() + 1) : std::string();
  const std::string joined = vexa::joined_credentials(user, password);
  check(joined.size() <= 255);
  const std::string credentials = vexa::base64_encode(joined);
  const std::string host = "192.168.0.100";
  const std::string path = "/command/inquiry.cgi?inq=" + vexa::as_one_word(text, "&");
  const vexa::Formatted request = vexa::http_get_request({host, 80, path, credentials});
  check(request.text.size() < vexa::kRequestRoom);
  const auto head = vexa::camera::parse_head(request.text);
  if (request.cut) return;
  check(head && vexa::camera::head_size(request.text) == request.text.size());
  if (user.find(':') == std::string::npos && joined.size() < 255) {
    check(vexa::camera::credentials_match(head->field("Authorization"), user, joined.substr(user.size() + 1)));
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(vexa_fuzz::text_of(data, size));
  encode_names(text);
  encode_credentials(text);
  ask_with(text);
  return 0;
}

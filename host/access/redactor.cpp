// SPDX-License-Identifier: Apache-2.0
#include "host/access/redactor.h"

#include <cstdint>

namespace vexa::host {
namespace {

constexpr char kHidden[] = "***";
constexpr std::string_view kBasic = "Authorization: Basic ";
constexpr char kAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

std::string base64(std::string_view text) {
  std::string out;
  for (std::size_t i = 0; i < text.size(); i += 3) {
    const std::string_view group = text.substr(i, 3);
    std::uint32_t bits = 0;
    for (std::size_t k = 0; k < 3; ++k)
      bits = bits << 8 | (k < group.size() ? static_cast<unsigned char>(group[k]) : 0u);
    for (std::size_t k = 0; k < 4; ++k) out += k <= group.size() ? kAlphabet[bits >> (18 - 6 * k) & 63] : '=';
  }
  return out;
}

void hide(std::string& text, const std::string& secret) {
  for (std::size_t at = text.find(secret); at != std::string::npos; at = text.find(secret, at)) {
    text.replace(at, secret.size(), kHidden);
    at += sizeof kHidden - 1;
  }
}

void hide_basic_values(std::string& text) {
  for (std::size_t at = text.find(kBasic); at != std::string::npos; at = text.find(kBasic, at)) {
    at += kBasic.size();
    const std::size_t end = std::min(text.find_first_of("\r\n", at), text.size());
    text.replace(at, end - at, kHidden);
  }
}

}  // namespace

Redactor::Redactor(const Credentials& credentials) {
  if (credentials.password.empty()) return;
  secrets_.push_back(base64(credentials.user + ":" + credentials.password));
  secrets_.push_back(credentials.password);
}

std::string Redactor::operator()(std::string_view text) const {
  std::string out(text);
  hide_basic_values(out);
  for (const std::string& secret : secrets_) hide(out, secret);
  return out;
}

}  // namespace vexa::host

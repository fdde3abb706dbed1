#include "virtual_camera/wire/credentials.h"

#include <cstddef>
#include <cstdint>

namespace vexa::camera {

std::string base64_text(std::string_view bytes) {
  static constexpr std::string_view kAlphabet = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
  std::string text;
  std::uint32_t bits = 0;
  unsigned held = 0;
  for (const char byte : bytes) {
    bits = (bits << 8U) | static_cast<unsigned char>(byte);
    held += 8;
    while (held >= 6) {
      held -= 6;
      text += kAlphabet[(bits >> held) & 63U];
    }
  }
  if (held > 0) text += kAlphabet[(bits << (6 - held)) & 63U];
  while (text.size() % 4 != 0) text += '=';
  return text;
}

bool credentials_match(std::string_view authorization, std::string_view user, std::string_view password) {
  if (user.empty() && password.empty()) return true;
  std::string pair(user);
  pair += ':';
  pair += password;
  return authorization == "Basic " + base64_text(pair);
}

}  // namespace vexa::camera

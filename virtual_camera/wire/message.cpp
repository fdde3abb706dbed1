// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/wire/message.h"

#include <fmt/format.h>

#include <algorithm>
#include <cctype>
#include <charconv>
#include <cstddef>
#include <cstdint>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

bool same_letter(char a, char b) {
  return std::tolower(static_cast<unsigned char>(a)) == std::tolower(static_cast<unsigned char>(b));
}

bool same_name(std::string_view a, std::string_view b) {
  return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), same_letter);
}

std::string_view trimmed(std::string_view text) {
  while (!text.empty() && (text.front() == ' ' || text.front() == '\t')) text.remove_prefix(1);
  while (!text.empty() && (text.back() == ' ' || text.back() == '\t')) text.remove_suffix(1);
  return text;
}

// Takes the next line off the text, without its end.
std::string_view take_line(std::string_view& text) {
  const std::size_t end = std::min(text.find('\n'), text.size());
  std::string_view line = text.substr(0, end);
  text.remove_prefix(std::min(end + 1, text.size()));
  if (!line.empty() && line.back() == '\r') line.remove_suffix(1);
  return line;
}

void split_target(RequestHead& head) {
  std::string_view rest = head.target;
  const std::size_t scheme = rest.find("://");
  if (scheme != std::string_view::npos) {
    rest.remove_prefix(scheme + 3);
    rest.remove_prefix(std::min(rest.find('/'), rest.size()));
  }
  const std::size_t question = std::min(rest.find('?'), rest.size());
  head.path = rest.substr(0, question);
  head.query = rest.substr(std::min(question + 1, rest.size()));
}

bool parse_request_line(std::string_view line, RequestHead& head) {
  const std::size_t first = line.find(' ');
  const std::size_t last = line.rfind(' ');
  if (first == std::string_view::npos || first == last || first == 0) return false;
  head.method = line.substr(0, first);
  head.target = line.substr(first + 1, last - first - 1);
  head.version = line.substr(last + 1);
  const bool known_version = head.version.starts_with("HTTP/") || head.version.starts_with("RTSP/");
  if (!known_version || head.target.find(' ') != std::string::npos) return false;
  split_target(head);
  return true;
}

std::size_t leading_empty_lines(std::string_view text) { return std::min(text.find_first_not_of("\r\n"), text.size()); }

}  // namespace

std::string_view RequestHead::field(std::string_view name) const {
  for (const auto& [present, value] : fields) {
    if (same_name(present, name)) return value;
  }
  return {};
}

std::size_t head_size(std::string_view received) {
  const std::size_t start = leading_empty_lines(received);
  const std::size_t with_returns = received.find("\r\n\r\n", start);
  const std::size_t without = received.find("\n\n", start);
  if (with_returns < without) return with_returns + 4;
  return without == std::string_view::npos ? 0 : without + 2;
}

std::optional<RequestHead> parse_head(std::string_view head) {
  if (head.find('\0') != std::string_view::npos) return std::nullopt;
  head.remove_prefix(leading_empty_lines(head));
  RequestHead parsed;
  if (!parse_request_line(take_line(head), parsed)) return std::nullopt;
  while (!head.empty()) {
    const std::string_view line = take_line(head);
    if (line.empty()) break;
    const std::size_t colon = line.find(':');
    if (colon == std::string_view::npos || colon == 0) return std::nullopt;
    parsed.fields.emplace_back(line.substr(0, colon), trimmed(line.substr(colon + 1)));
  }
  return parsed;
}

std::vector<std::pair<std::string, std::string>> query_pairs(std::string_view query) {
  std::vector<std::pair<std::string, std::string>> pairs;
  while (!query.empty()) {
    const std::size_t end = std::min(query.find('&'), query.size());
    const std::string_view pair = query.substr(0, end);
    query.remove_prefix(std::min(end + 1, query.size()));
    const std::size_t equals = pair.find('=');
    if (equals == std::string_view::npos || equals == 0) continue;
    pairs.emplace_back(pair.substr(0, equals), pair.substr(equals + 1));
  }
  return pairs;
}

Answer http_answer(std::string_view status, std::string_view body) {
  Answer answer;
  std::from_chars(status.data(), status.data() + status.size(), answer.status);
  const std::string_view challenge = answer.status == 401 ? "WWW-Authenticate: Basic realm=\"camera\"\r\n" : "";
  answer.bytes = fmt::format("HTTP/1.0 {}\r\n{}Content-Type: text/plain\r\nContent-Length: {}\r\n\r\n{}", status,
                             challenge, body.size(), body);
  return answer;
}

Answer no_content() { return {204, "HTTP/1.0 204 No Content\r\n\r\n"}; }

std::optional<std::string> percent_decoded(std::string_view text) {
  std::string bytes;
  while (!text.empty()) {
    std::size_t length = 1;
    unsigned value = static_cast<unsigned char>(text.front());
    if (text.front() == '%') {
      length = 3;
      if (text.size() < length) return std::nullopt;
      const auto code = whole_number<unsigned>(text.substr(1, 2), 16);
      if (!code) return std::nullopt;
      value = *code;
    }
    bytes += static_cast<char>(value);
    text.remove_prefix(length);
  }
  return bytes;
}

std::string percent_encoded_for_list(std::string_view text) {
  constexpr std::string_view kMarks = "%,&";
  std::string encoded;
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    const bool plain = byte >= ' ' && byte != 0x7F && kMarks.find(c) == std::string_view::npos;
    encoded += plain ? std::string(1, c) : fmt::format("%{:02X}", byte);
  }
  return encoded;
}

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

// SPDX-License-Identifier: Apache-2.0
// What is read from HTTP answers: header end and status line, the announced length of a picture, and values of
// inquiries, for which the input is a key, a NUL, and an answer.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "runtime/base/text.h"
#include "transport/wire/http_answer.h"

namespace {

void read_head(std::string_view answer) {
  const std::size_t header = vexa::header_length(answer);
  if (header > answer.size() || (header != 0 && !answer.substr(0, header).ends_with("\n"))) std::abort();
  const auto line = vexa::parse_status_line(answer, "HTTP/");
  if (line && (line->reason.empty() || line->reason.size() > 1023)) std::abort();
  const auto length = vexa::announced_length(answer);
  if (length && *length < 0) std::abort();
}

void read_value(std::string_view input) {
  const std::string_view key = vexa::before_nul(input);
  const std::string_view answer = input.substr(input.size() > key.size() ? key.size() + 1 : key.size());
  const auto value = vexa::cgi_value(answer, key);
  if (value.has_value() != (answer.find(key) != std::string_view::npos)) std::abort();
  if (value && value->find('&') != std::string_view::npos) std::abort();
  if (value) static_cast<void>(vexa::leading_int(std::string(*value)));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view input(reinterpret_cast<const char*>(data), size);
  read_head(input);
  read_value(input);
  return 0;
}

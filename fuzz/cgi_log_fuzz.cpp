// SPDX-License-Identifier: Apache-2.0
// The CGI log as vexactl reads it back: in whatever pieces it comes, the same exchanges are found, and each is shown as
// one line without control characters. The first byte of the input is the length of the pieces.
#include <string>
#include <vector>

#include "fuzz/check.h"
#include "host/cgi_log/cgi_log.h"

namespace {

using vexa_fuzz::check;
namespace host = vexa::host;

bool is_one_line(const std::string& row) {
  if (row.empty() || row.back() != '\n') return false;
  for (const char letter : row.substr(0, row.size() - 1)) {
    if (static_cast<unsigned char>(letter) < ' ' || letter == 0x7f) return false;
  }
  return true;
}

std::string rows(std::string_view log, std::size_t piece) {
  std::string text;
  const host::Redactor redactor;
  host::CgiLogReader reader([&](const host::CgiExchange& exchange) {
    check(exchange.request || exchange.answer);
    static_cast<void>(exchange.duration());
    const std::string row = host::table_row(exchange, redactor);
    check(is_one_line(row));
    const std::string json = host::json_row(exchange, redactor);
    check(is_one_line(json));
    text += row + json;
  });
  for (std::size_t at = 0; at < log.size(); at += piece) reader.feed(log.substr(at, piece));
  reader.settle();
  reader.finish();
  return text;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::string_view log = vexa_fuzz::text_of(data + 1, size - 1);
  check(rows(log, 1 + data[0]) == rows(log, size));
  return 0;
}

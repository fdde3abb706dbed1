// The header end and the status line of HTTP answers.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "transport/wire/http_answer.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view answer(reinterpret_cast<const char*>(data), size);
  const std::size_t header = vexa::header_length(answer);
  if (header > size || (header != 0 && !answer.substr(0, header).ends_with("\n"))) std::abort();
  const auto line = vexa::parse_status_line(answer, "HTTP/");
  if (line && (line->reason.empty() || line->reason.size() > 1023)) std::abort();
  return 0;
}

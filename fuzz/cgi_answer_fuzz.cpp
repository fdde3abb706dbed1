// Values of inquiries: the input is a key, a NUL, and an answer.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "runtime/base/text.h"
#include "transport/wire/http_answer.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view input(reinterpret_cast<const char*>(data), size);
  const std::string_view key = vexa::before_nul(input);
  const std::string_view answer = input.substr(input.size() > key.size() ? key.size() + 1 : key.size());
  const auto value = vexa::cgi_value(answer, key);
  if (value.has_value() != (answer.find(key) != std::string_view::npos)) std::abort();
  if (value && value->find('&') != std::string_view::npos) std::abort();
  if (value) static_cast<void>(vexa::leading_int(std::string(*value)));
  return 0;
}

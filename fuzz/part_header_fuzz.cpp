// The announced length of a picture.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "transport/wire/http_answer.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto length = vexa::announced_length({reinterpret_cast<const char*>(data), size});
  if (length && *length < 0) std::abort();
  return 0;
}

// The sequence parameter set reader of the command-line host: the input is a picture.
#include "host/recording/stream_parameters.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto stream = vexa::host::read_stream_parameters(data, size);
  if (!stream) return 0;
  const bool sound = stream->width > 0 && stream->height > 0 && stream->frame_rate >= 0 && stream->frame_rate <= 1000;
  if (!sound) std::abort();
  return 0;
}

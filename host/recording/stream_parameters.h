// What an H.264 stream says of itself.
#ifndef HOST_RECORDING_STREAM_PARAMETERS_H_
#define HOST_RECORDING_STREAM_PARAMETERS_H_

#include <cstddef>
#include <cstdint>
#include <optional>

namespace vexa::host {

struct StreamParameters {
  std::uint32_t width = 0;   // pixels, cropping applied
  std::uint32_t height = 0;  // pixels
  double frame_rate = 0;     // pictures a second; 0: the stream does not say
};

// Reads the first sequence parameter set (ITU-T H.264, 7.3.2.1.1 and E.1.1) of a picture in Annex B byte stream format.
// Nothing when there is none, or when it makes no sense.
[[nodiscard]] std::optional<StreamParameters> read_stream_parameters(const unsigned char* picture, std::size_t length);

}  // namespace vexa::host

#endif  // HOST_RECORDING_STREAM_PARAMETERS_H_

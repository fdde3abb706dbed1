// Pictures as cameras of a bit rate send them, in RTP payloads. Nobody decodes them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "bench/peers/options.h"

namespace vexa_peers {

using Payload = std::vector<unsigned char>;

struct Picture {
  std::vector<Payload> payloads;  ///< the last ends with room for a stamp
};

/// "T=" and 16 hexadecimal digits: when the last datagram of a picture was sent, nanoseconds of the monotonic clock.
inline constexpr std::size_t kStampLength = 18;
void write_stamp(unsigned char* place, std::int64_t nanoseconds);
/// The stamp near the end of a frame; 0 when there is none.
std::int64_t read_stamp(const unsigned char* data, std::size_t length);

class MadeStream {
 public:
  explicit MadeStream(const Options& options);

  /// The picture of that number. Each 25th is a key picture, four times as large, and the others vary by a third; of
  /// JPEG, and where pictures are large, all are alike.
  const Picture& picture(std::uint64_t number) const;
  int payload_type() const { return payload_type_; }
  /// The session description that fits.
  std::string description() const;

 private:
  std::vector<Picture> pictures_;
  std::string encoding_;
  int payload_type_ = 96;
};

}  // namespace vexa_peers

// SPDX-License-Identifier: Apache-2.0
// Rebuilds pictures from RTP payloads, written from RFC 6184 for the tests alone.
#ifndef TESTS_VIRTUAL_CAMERA_DEPACKETISER_H_
#define TESTS_VIRTUAL_CAMERA_DEPACKETISER_H_

#include <cstdint>
#include <span>
#include <vector>

namespace vexa::camera {

class Depacketiser {
 public:
  void add(std::span<const std::uint8_t> payload) {
    constexpr std::uint8_t kFuA = 28;
    if ((payload[0] & 0x1FU) != kFuA) {
      begin_unit();
      append(payload);
      return;
    }
    if ((payload[1] & 0x80U) != 0) {
      begin_unit();
      picture_.push_back(static_cast<std::uint8_t>((payload[0] & 0xE0U) | (payload[1] & 0x1FU)));
    }
    append(payload.subspan(2));
  }

  std::vector<std::uint8_t> take() { return std::move(picture_); }

 private:
  void begin_unit() { picture_.insert(picture_.end(), {0, 0, 0, 1}); }
  void append(std::span<const std::uint8_t> bytes) { picture_.insert(picture_.end(), bytes.begin(), bytes.end()); }

  std::vector<std::uint8_t> picture_;
};

}  // namespace vexa::camera

#endif  // TESTS_VIRTUAL_CAMERA_DEPACKETISER_H_

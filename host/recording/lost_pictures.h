// SPDX-License-Identifier: Apache-2.0
// How many pictures of a stream were lost, and why, by the driver's own count.
#ifndef HOST_RECORDING_LOST_PICTURES_H_
#define HOST_RECORDING_LOST_PICTURES_H_

#include <array>
#include <cstddef>
#include <cstdint>
#include <nlohmann/json_fwd.hpp>
#include <string>

#include "vexa/statistics.h"

namespace vexa::host {

// What a total that only rises has gained; all of it where the driver has begun anew.
[[nodiscard]] constexpr std::uint64_t rise(std::uint64_t from, std::uint64_t to) { return to >= from ? to - from : to; }

// Totals of a stretch of a stream. Of a picture none of whose packets has come the driver knows nothing but that
// packets are missing.
class LostPictures {
 public:
  // One row a reason.
  struct Reason {
    const char* word;  // in JSON
    const char* text;
    std::uint64_t StreamStatistics::*count;
  };
  static const std::array<Reason, 7>& reasons();

  LostPictures() = default;
  explicit LostPictures(const StreamStatistics& statistics);

  // What has come since an earlier count; all of it where the driver has begun to count anew meanwhile.
  [[nodiscard]] LostPictures since(const LostPictures& earlier) const;

  [[nodiscard]] std::uint64_t pictures() const { return pictures_; }  // of which anything came
  [[nodiscard]] std::uint64_t lost() const { return lost_; }
  [[nodiscard]] std::uint64_t packets() const { return packets_; }  // that never came
  [[nodiscard]] std::uint64_t of(std::size_t reason) const { return by_reason_[reason]; }
  [[nodiscard]] bool any() const { return lost_ > 0 || packets_ > 0; }
  // "14 of 54 pictures were lost: 14 without the key picture before them; 3 packets never came".
  [[nodiscard]] std::string text() const;

 private:
  std::uint64_t pictures_ = 0;
  std::uint64_t lost_ = 0;
  std::uint64_t packets_ = 0;
  std::array<std::uint64_t, 7> by_reason_{};
};

[[nodiscard]] nlohmann::ordered_json json_of(const LostPictures& lost);

}  // namespace vexa::host

#endif  // HOST_RECORDING_LOST_PICTURES_H_

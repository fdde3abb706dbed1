// SPDX-License-Identifier: Apache-2.0
// The names of segment files.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace vexa::node {

/// "20260131T235959250Z_gate_0_17.mp4": the first picture's time in UTC, the camera, the token of the claim that it was
/// recorded under (0 without claims), and a counter. A segment that is being written ends in ".part"; one that was cut
/// short and repaired in ".recovered.mp4".
struct SegmentName {
  enum class State { kWriting, kWhole, kRecovered };

  std::chrono::milliseconds start{0};  ///< since 1970
  std::string camera = {};
  std::uint64_t token = 0;
  std::uint64_t counter = 0;
  State state = State::kWriting;

  bool operator==(const SegmentName& other) const = default;
};

[[nodiscard]] std::string file_name_of(const SegmentName& name);
/// nullopt for names of other files.
[[nodiscard]] std::optional<SegmentName> segment_of(std::string_view file_name);

/// A camera's name as a part of file names: letters, digits and hyphens stay, every other byte becomes "%" and two
/// hexadecimal digits. Different names stay different.
[[nodiscard]] std::string escaped_camera(std::string_view camera);

}  // namespace vexa::node

// SPDX-License-Identifier: Apache-2.0
// An H.264 clip in the byte stream format of ITU-T H.264 Annex B, cut into access units.
#ifndef VIRTUAL_CAMERA_CODEC_CLIP_H_
#define VIRTUAL_CAMERA_CODEC_CLIP_H_

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace vexa::camera {

struct NalUnit {
  std::size_t offset = 0;  // of its header byte, in the access unit's bytes
  std::size_t size = 0;    // without start code and trailing zeros
  std::uint8_t type = 0;
};

struct AccessUnit {
  std::vector<std::uint8_t> bytes;  // exactly as in the file, start codes included
  std::vector<NalUnit> units;
  bool key = false;  // carries an IDR slice

  [[nodiscard]] std::span<const std::uint8_t> unit(const NalUnit& nal) const {
    return std::span(bytes).subspan(nal.offset, nal.size);
  }
  // The picture as a receiver rebuilds it from RTP: every NAL unit after a start code of four bytes.
  [[nodiscard]] std::vector<std::uint8_t> as_delivered() const;
};

// Holds the whole clip in memory. Immutable after loading and shared by any number of streams.
class Clip {
 public:
  Clip() = default;
  explicit Clip(std::vector<AccessUnit> access_units) : access_units_(std::move(access_units)) {}
  // Nothing when the file cannot be read or holds no access unit.
  [[nodiscard]] static std::optional<Clip> load(const std::string& path);
  // Bytes before the first start code are left out.
  [[nodiscard]] static Clip from_annex_b(std::span<const std::uint8_t> bytes);
  [[nodiscard]] static Clip from_annex_b(std::string_view bytes) {
    return from_annex_b(std::span(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()));
  }

  [[nodiscard]] const std::vector<AccessUnit>& access_units() const { return access_units_; }
  // Every picture as a receiver rebuilds it.
  [[nodiscard]] std::vector<std::string> delivered() const;

 private:
  std::vector<AccessUnit> access_units_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CODEC_CLIP_H_

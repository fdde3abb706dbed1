// SPDX-License-Identifier: Apache-2.0
// The destination of a recording's pictures.
#ifndef HOST_RECORDING_PICTURE_TARGET_H_
#define HOST_RECORDING_PICTURE_TARGET_H_

#include <chrono>
#include <cstddef>
#include <optional>
#include <string>

#include "host/base/codec.h"
#include "host/base/problem.h"

namespace vexa::host {

// One picture as the driver delivered it.
struct RecordedPicture {
  const unsigned char* data = nullptr;
  std::size_t length = 0;
  Codec codec = Codec::kH264;
  bool key = false;
  std::chrono::microseconds time{0};  // since 1970
};

// Writes pictures to one file. Owned by the command that records, used on its thread. Creates no file before the first
// picture.
class PictureTarget {
 public:
  PictureTarget() = default;
  virtual ~PictureTarget() = default;
  PictureTarget(const PictureTarget&) = delete;
  PictureTarget& operator=(const PictureTarget&) = delete;

  // Reports early the failure that the first picture would most likely meet. Creates no file.
  [[nodiscard]] virtual std::optional<Problem> check() const = 0;
  // The first picture is a key picture.
  [[nodiscard]] virtual std::optional<Problem> write(const RecordedPicture& picture) = 0;
  [[nodiscard]] virtual std::optional<Problem> close() = 0;
  [[nodiscard]] virtual const std::string& path() const = 0;
};

}  // namespace vexa::host

#endif  // HOST_RECORDING_PICTURE_TARGET_H_

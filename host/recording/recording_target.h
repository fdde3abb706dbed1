// SPDX-License-Identifier: Apache-2.0
// What --out names: a file of pictures one after the other, or a container.
#ifndef HOST_RECORDING_RECORDING_TARGET_H_
#define HOST_RECORDING_RECORDING_TARGET_H_

#include <memory>
#include <optional>
#include <string>

#include "host/recording/picture_target.h"

namespace vexa::host {

// ".mkv" and ".mp4" are containers, ".h264" or ".264", ".m4v", ".mjpeg" or ".mjpg" the pictures of one codec; any other
// name, and "-" for standard output, is the pictures of the codec that comes.
class RecordingTarget {
 public:
  // `standard_output` is open and stays so.
  RecordingTarget(std::string out, int standard_output) : out_(std::move(out)), standard_output_(standard_output) {}

  [[nodiscard]] bool is_standard_output() const { return out_ == "-"; }
  // Reports early that the target cannot be written.
  [[nodiscard]] std::optional<Problem> check() const;
  // The codec that the name implies; nullopt when any can go there.
  [[nodiscard]] std::optional<Codec> codec() const;
  [[nodiscard]] std::unique_ptr<PictureTarget> open() const;

 private:
  const std::string out_;
  const int standard_output_;
};

// The usual extension of a file with a codec's pictures, such as ".h264".
[[nodiscard]] std::string usual_extension(Codec codec);

}  // namespace vexa::host

#endif  // HOST_RECORDING_RECORDING_TARGET_H_

// SPDX-License-Identifier: Apache-2.0
// What --out names: a file of pictures one after the other, or a container.
#ifndef HOST_RECORDING_RECORDING_TARGET_H_
#define HOST_RECORDING_RECORDING_TARGET_H_

#include <memory>
#include <optional>
#include <string>

#include "host/recording/media_container.h"
#include "host/recording/picture_target.h"

namespace vexa::host {

// The format is --format's where it is given, else that of the name's end: ".mkv" and ".mp4" are containers, ".h264" or
// ".264", ".m4v", ".mjpeg" or ".mjpg" the pictures of one codec. Standard output, "-", takes the pictures of any codec
// where no format is given; a file without a known end is refused.
class RecordingTarget {
 public:
  // `standard_output` is open and stays so.
  RecordingTarget(std::string out, int standard_output, std::optional<std::string> format = std::nullopt)
      : out_(std::move(out)), standard_output_(standard_output), format_(std::move(format)) {}

  [[nodiscard]] bool is_standard_output() const { return out_ == "-"; }
  // Reports an unknown format, and early that the target cannot be written.
  [[nodiscard]] std::optional<Problem> check() const;
  // The codec that the format implies; nullopt when any can go there.
  [[nodiscard]] std::optional<Codec> codec() const;
  // The container that the format is, if it is one; names end in ".mkv" or ".mp4" in capitals too.
  [[nodiscard]] std::optional<ContainerFormat> container() const;
  // Of a target that has been checked.
  [[nodiscard]] std::unique_ptr<PictureTarget> open() const;

 private:
  const std::string out_;
  const int standard_output_;
  const std::optional<std::string> format_;
};

// The usual extension of a file with a codec's pictures, such as ".h264".
[[nodiscard]] std::string usual_extension(Codec codec);

}  // namespace vexa::host

#endif  // HOST_RECORDING_RECORDING_TARGET_H_

// SPDX-License-Identifier: Apache-2.0
// The file that a recording goes to.
#ifndef HOST_RECORDING_FRAME_FILE_H_
#define HOST_RECORDING_FRAME_FILE_H_

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "host/base/unique_fd.h"
#include "host/recording/picture_target.h"

namespace vexa::host {

// Opened with the first picture, so that a recording that never begins leaves no empty file and does not empty a former
// recording. Owned by a command, used on its thread.
class FrameFile final : public PictureTarget {
 public:
  explicit FrameFile(std::string path) : path_(std::move(path)) {}
  // Writes to a descriptor that is already open, and leaves it open.
  FrameFile(std::string name, int open_fd) : path_(std::move(name)), given_fd_(open_fd) {}

  [[nodiscard]] std::optional<Problem> check() const override;
  [[nodiscard]] std::optional<Problem> write(const unsigned char* data, std::size_t length);
  [[nodiscard]] std::optional<Problem> write(const RecordedPicture& picture) override {
    return write(picture.data, picture.length);
  }
  // Overwrites a part of a file of its own, `at` bytes from its beginning.
  [[nodiscard]] std::optional<Problem> overwrite(std::size_t at, const unsigned char* data, std::size_t length);
  [[nodiscard]] std::optional<Problem> close() override;
  [[nodiscard]] const std::string& path() const override { return path_; }

 private:
  [[nodiscard]] Problem problem(int error) const;

  std::string path_;
  int given_fd_ = -1;
  UniqueFd file_;
};

// Writes a whole file at once and closes it; a former one is replaced.
[[nodiscard]] std::optional<Problem> write_whole_file(FrameFile&& file, const std::vector<std::uint8_t>& bytes);

}  // namespace vexa::host

#endif  // HOST_RECORDING_FRAME_FILE_H_

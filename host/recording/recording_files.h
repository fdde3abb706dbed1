// SPDX-License-Identifier: Apache-2.0
// The files of a recording that may go on for ever.
#ifndef HOST_RECORDING_RECORDING_FILES_H_
#define HOST_RECORDING_RECORDING_FILES_H_

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "host/recording/picture_target.h"

namespace vexa::host {

// One file after the other, each of which begins with a key picture and is closed whole. With a segment's length a new
// one begins with the first key picture that is so much later than its file; without, only where the stream has become
// another one. Owned by a command, used on its thread.
class RecordingFiles {
 public:
  // Makes the file of that name, which is not written yet.
  using Open = std::function<std::unique_ptr<PictureTarget>(const std::string& path)>;

  // `out` is the file's name without segments; those with a time have it before the name's end. A file that is there is
  // replaced only where it is named `out`. "-", standard output, has all of them.
  RecordingFiles(std::string out, std::optional<std::chrono::microseconds> segment, Open open)
      : out_(std::move(out)), segment_(segment), open_(std::move(open)) {}

  // Passes over pictures that cannot be decoded since no key picture came before them: false in `kept`.
  [[nodiscard]] std::optional<Problem> write(const RecordedPicture& picture, bool& kept);
  // Pictures are missing before the next one: the file goes on with a key picture.
  void miss() { needs_key_ = true; }
  // The stream is another one from the next picture on: it begins a file.
  void begin_anew() { needs_key_ = anew_ = true; }
  [[nodiscard]] std::optional<Problem> close();

  [[nodiscard]] std::size_t count() const { return count_; }
  // The latest; `out` before the first.
  [[nodiscard]] const std::string& path() const { return count_ == 0 ? out_ : path_; }

 private:
  [[nodiscard]] bool is_due(const RecordedPicture& key) const;
  [[nodiscard]] std::string next_path(std::chrono::microseconds time) const;

  const std::string out_;
  const std::optional<std::chrono::microseconds> segment_;
  const Open open_;
  std::unique_ptr<PictureTarget> file_;
  std::string path_;
  Codec codec_ = Codec::kH264;
  std::chrono::microseconds began_{0};
  std::size_t count_ = 0;
  bool needs_key_ = true;
  bool anew_ = false;
};

// The name with "-20260131T235959Z" before its end, or "-20260131T235959Z-2" and so on where that is taken.
[[nodiscard]] std::string name_with_time(const std::string& path, std::chrono::seconds since_1970);

}  // namespace vexa::host

#endif  // HOST_RECORDING_RECORDING_FILES_H_

// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recording_files.h"

#include <fmt/format.h>
#include <unistd.h>

#include <algorithm>
#include <utility>

#include "host/words/utc_time.h"

namespace vexa::host {
namespace {

bool is_taken(const std::string& path) { return access(path.c_str(), F_OK) == 0; }

}  // namespace

std::optional<Problem> RecordingFiles::write(const RecordedPicture& picture, bool& kept) {
  kept = picture.key || !needs_key_;
  if (!kept) return std::nullopt;
  if (picture.key && is_due(picture)) {
    if (auto problem = close()) return problem;
    path_ = next_path(picture.time);
    file_ = open_(path_);
    ++count_;
    codec_ = picture.codec;
    began_ = picture.time;
  }
  needs_key_ = anew_ = false;
  return file_->write(picture);
}

std::optional<Problem> RecordingFiles::close() {
  const std::unique_ptr<PictureTarget> ended = std::exchange(file_, nullptr);
  return ended ? ended->close() : std::nullopt;
}

bool RecordingFiles::is_due(const RecordedPicture& key) const {
  return !file_ || anew_ || key.codec != codec_ || (segment_ && key.time - began_ >= *segment_);
}

std::string RecordingFiles::next_path(std::chrono::microseconds time) const {
  if ((!segment_ && count_ == 0) || out_ == "-") return out_;
  return name_with_time(out_, std::chrono::floor<std::chrono::seconds>(time));
}

std::string name_with_time(const std::string& path, std::chrono::seconds since_1970) {
  std::string time = utc_text(since_1970);
  time.erase(std::remove_if(time.begin(), time.end(), [](char c) { return c == '-' || c == ':'; }), time.end());
  const std::size_t slash = path.rfind('/');
  const std::size_t dot = path.rfind('.');
  const bool has_end = dot != std::string::npos && (slash == std::string::npos || dot > slash + 1) && dot > 0;
  const std::string stem = has_end ? path.substr(0, dot) : path;
  const std::string end = has_end ? path.substr(dot) : "";
  std::string name = fmt::format("{}-{}{}", stem, time, end);
  for (int number = 2; is_taken(name); ++number) name = fmt::format("{}-{}-{}{}", stem, time, number, end);
  return name;
}

}  // namespace vexa::host

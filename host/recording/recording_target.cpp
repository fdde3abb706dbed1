// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recording_target.h"

#include <fmt/format.h>
#include <sys/stat.h>

#include <algorithm>
#include <iterator>
#include <string_view>

#include "host/base/file_extension.h"
#include "host/base/printable.h"
#include "host/recording/frame_file.h"
#include "host/recording/media_container.h"

namespace vexa::host {
namespace {

struct Format {
  std::string_view word;
  std::string_view extension;
  std::optional<Codec> codec;
  std::optional<ContainerFormat> container;
};

// The first extension of a codec is the usual one.
constexpr Format kFormats[] = {{"mkv", ".mkv", std::nullopt, ContainerFormat::kMatroska},
                               {"mp4", ".mp4", std::nullopt, ContainerFormat::kMp4},
                               {"h264", ".h264", Codec::kH264, std::nullopt},
                               {"h264", ".264", Codec::kH264, std::nullopt},
                               {"m4v", ".m4v", Codec::kMpeg4, std::nullopt},
                               {"mjpeg", ".mjpeg", Codec::kJpeg, std::nullopt},
                               {"mjpeg", ".mjpg", Codec::kJpeg, std::nullopt}};

constexpr char kWords[] = "mkv, mp4, h264, m4v or mjpeg";

const Format* find_format(const std::string& out, const std::optional<std::string>& word) {
  const auto* found = std::find_if(std::begin(kFormats), std::end(kFormats), [&](const Format& format) {
    return word ? format.word == *word : has_extension(out, format.extension);
  });
  return found == std::end(kFormats) ? nullptr : found;
}

// A device or a pipe takes pictures under any name; a folder is refused as what cannot be written.
bool is_no_plain_file(const std::string& path) {
  struct stat found {};
  return stat(path.c_str(), &found) == 0 && !S_ISREG(found.st_mode);
}

}  // namespace

std::optional<Problem> RecordingTarget::check() const {
  if (find_format(out_, format_) == nullptr) {
    if (format_)
      return usage(fmt::format("unknown format \"{}\"", printable(*format_)), fmt::format("Choose {}.", kWords));
    if (!is_standard_output() && !is_no_plain_file(out_)) {
      return usage(fmt::format("the end of {} names no format of video", printable(out_)),
                   fmt::format("End --out in .mkv, .mp4, .h264, .m4v or .mjpeg, or give --format {}.", kWords));
    }
  }
  return open()->check();
}

std::optional<Codec> RecordingTarget::codec() const {
  const Format* format = find_format(out_, format_);
  return format != nullptr ? format->codec : std::nullopt;
}

std::optional<ContainerFormat> RecordingTarget::container() const {
  const Format* format = find_format(out_, format_);
  return format != nullptr ? format->container : std::nullopt;
}

std::unique_ptr<PictureTarget> RecordingTarget::open() const {
  const std::string name = is_standard_output() ? "standard output" : out_;
  const int open_fd = is_standard_output() ? standard_output_ : -1;
  if (const auto format = container()) return std::make_unique<MediaContainer>(name, *format, open_fd);
  return std::make_unique<FrameFile>(name, open_fd);
}

std::string usual_extension(Codec codec) {
  return std::string(std::find_if(std::begin(kFormats), std::end(kFormats), [codec](const Format& row) {
                       return row.codec == codec;
                     })->extension);
}

}  // namespace vexa::host

// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recording_target.h"

#include <algorithm>
#include <iterator>

#include "host/base/file_extension.h"
#include "host/recording/frame_file.h"
#include "host/recording/media_container.h"

namespace vexa::host {
namespace {

struct CodecExtension {
  const char* extension;
  Codec codec;
};

// The first of a codec is the usual one.
constexpr CodecExtension kExtensions[] = {{".h264", Codec::kH264},
                                          {".264", Codec::kH264},
                                          {".m4v", Codec::kMpeg4},
                                          {".mjpeg", Codec::kJpeg},
                                          {".mjpg", Codec::kJpeg}};

}  // namespace

std::optional<Problem> RecordingTarget::check() const { return open()->check(); }

std::optional<Codec> RecordingTarget::codec() const {
  for (const CodecExtension& row : kExtensions) {
    if (has_extension(out_, row.extension)) return row.codec;
  }
  return std::nullopt;
}

std::unique_ptr<PictureTarget> RecordingTarget::open() const {
  if (is_standard_output()) return std::make_unique<FrameFile>("standard output", standard_output_);
  if (const auto format = container_format_of(out_)) return std::make_unique<MediaContainer>(out_, *format);
  return std::make_unique<FrameFile>(out_);
}

std::string usual_extension(Codec codec) {
  return std::find_if(std::begin(kExtensions), std::end(kExtensions),
                      [codec](const CodecExtension& row) { return row.codec == codec; })
      ->extension;
}

}  // namespace vexa::host

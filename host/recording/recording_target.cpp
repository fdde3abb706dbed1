#include "host/recording/recording_target.h"

#include "host/base/name_end.h"
#include "host/recording/frame_file.h"
#include "host/recording/media_container.h"

namespace vexa::host {
namespace {

struct CodecEnding {
  const char* end;
  const char* codec;
};

// The first of a codec is the usual one.
constexpr CodecEnding kCodecEndings[] = {
    {".h264", "H.264"}, {".264", "H.264"}, {".m4v", "MPEG4"}, {".mjpeg", "JPEG"}, {".mjpg", "JPEG"}};

}  // namespace

std::optional<Problem> RecordingTarget::check() const { return open({})->check(); }

std::optional<std::string> RecordingTarget::codec() const {
  for (const CodecEnding& ending : kCodecEndings) {
    if (has_end(out_, ending.end)) return ending.codec;
  }
  return std::nullopt;
}

std::unique_ptr<PictureTarget> RecordingTarget::open(const std::string& codec) const {
  if (is_standard_output()) return std::make_unique<FrameFile>("standard output", standard_output_);
  if (const auto format = container_format_of(out_)) return std::make_unique<MediaContainer>(out_, *format, codec);
  return std::make_unique<FrameFile>(out_);
}

std::string usual_end(const std::string& codec) {
  for (const CodecEnding& ending : kCodecEndings) {
    if (codec == ending.codec) return ending.end;
  }
  return ".video";
}

}  // namespace vexa::host

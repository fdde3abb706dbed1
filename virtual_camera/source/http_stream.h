// SPDX-License-Identifier: Apache-2.0
// An endless HTTP answer as a sequence of pieces, each with its time: video as multipart JPEG or as an elementary
// stream, or sound; with its faults. Knows no socket and no clock.
#ifndef VIRTUAL_CAMERA_SOURCE_HTTP_STREAM_H_
#define VIRTUAL_CAMERA_SOURCE_HTTP_STREAM_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/codec/image_clip.h"
#include "virtual_camera/source/picture_source.h"
#include "virtual_camera/values/faults.h"

namespace vexa::camera {

struct HttpStreamOptions {
  double units_per_second = 25;  // pictures, or pieces of sound
  bool loop = true;
  std::uint64_t units = 0;                 // end after so many; 0: no such end
  std::size_t piece = 0;                   // bytes that leave at a time; 0: a unit at once
  double speed = 1;                        // of sources
  std::function<std::string()> user_data;  // of a picture that leaves now; empty: none
  std::vector<HttpStreamFault> faults;
};

// Owned by a MediaStream, which asks for each piece when it is due. One thread at a time.
class HttpStream {
 public:
  struct Piece {
    std::chrono::nanoseconds due;  // after the stream's beginning
    std::string bytes;
  };

  // Video; `source` is not null.
  HttpStream(std::unique_ptr<PictureSource> source, HttpStreamOptions options);
  // `clip` is not null.
  HttpStream(std::shared_ptr<const ImageClip> clip, HttpStreamOptions options);
  // Sound: the file's bytes, `unit` at a time.
  HttpStream(std::string sound, std::size_t unit, HttpStreamOptions options);

  // The head of the answer.
  [[nodiscard]] std::string head() const;
  // When the next piece leaves; none at the stream's end, or while its source has no picture.
  [[nodiscard]] std::optional<std::chrono::nanoseconds> next_due();
  // Whether the next piece begins a picture or a piece of sound; only after next_due() has found one.
  [[nodiscard]] bool begins_unit() const { return !made_; }
  // The next piece, made as it leaves; empty where a fault leaves no byte of it, or none is due.
  [[nodiscard]] std::string take();
  // Both at once, over empty pieces; none at the stream's end.
  [[nodiscard]] std::optional<Piece> next();
  // Whether next_due() returned none only because the source has no picture yet; then wait() calls `ready` as the
  // source's does.
  [[nodiscard]] bool waits() const;
  void wait(const std::function<void()>& ready) { source_->wait(ready); }
  // Whether the connection closes at the stream's end; else it stays, silent.
  [[nodiscard]] bool closes() const { return closes_; }

 private:
  [[nodiscard]] bool load_unit();
  [[nodiscard]] bool load_content();
  [[nodiscard]] std::string content() const;
  [[nodiscard]] std::string unit_bytes(const std::string& content) const;
  [[nodiscard]] const HttpStreamFault* fault(HttpStreamFault::Action action) const;
  void change_clip(const std::string& path);
  void apply_faults();
  [[nodiscard]] bool is_jpeg() const;
  [[nodiscard]] std::chrono::nanoseconds paced(std::chrono::nanoseconds time) const;

  std::unique_ptr<PictureSource> source_;  // null: sound, or another clip was to follow and is not there
  std::optional<SourcePicture> picture_;   // of the present unit
  std::string sound_;
  std::size_t sound_unit_ = 0;
  HttpStreamOptions options_;
  std::uint64_t index_ = 0;  // of the present unit, or of the next
  std::chrono::nanoseconds source_began_{0};
  std::chrono::nanoseconds planned_{0};  // when the unit leaves, without the pauses
  std::chrono::nanoseconds late_{0};     // all pauses so far
  std::string unit_;                     // what has not left of it
  bool loaded_ = false;                  // a unit is being sent
  bool made_ = false;                    // its bytes are
  bool ended_ = false;
  bool closes_ = true;
};

// Bytes that a second of sound has, by the camera's word of its codec ("g711_64"); 0 for an unknown one.
[[nodiscard]] std::size_t sound_rate(std::string_view codec);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_HTTP_STREAM_H_

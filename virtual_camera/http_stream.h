// An endless HTTP answer as a sequence of pieces, each with its time: video as multipart JPEG or as an elementary
// stream, or sound; with its faults. Knows no socket and no clock.
#ifndef VIRTUAL_CAMERA_HTTP_STREAM_H_
#define VIRTUAL_CAMERA_HTTP_STREAM_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/image_clip.h"

namespace vexa::camera {

// What goes wrong at one picture or piece of sound, counted from 0 in each stream.
struct HttpStreamFault {
  enum class Action {
    kDataLength,    // "DataLen: " is followed by `text`
    kNoDataLength,  // the part does not announce its length
    kBefore,        // `text` stands in front of it
    kCut,           // only the first `bytes` bytes of it are sent; the stream goes on with the next
    kClose,         // the connection closes after `bytes` bytes of it
    kSilence,       // nothing more comes after `bytes` bytes of it
    kPause,         // it comes later by `time`, and so does all that follows
    kOtherClip,     // from here on the stream sends the clip of the file `text`, from its beginning
  };

  std::uint64_t index = 0;
  Action action = Action::kSilence;
  std::string text;
  std::size_t bytes = 0;
  std::chrono::milliseconds time{0};
};

struct HttpStreamOptions {
  double units_per_second = 25;  // pictures, or pieces of sound
  bool loop = true;
  std::uint64_t units = 0;  // end after so many; 0: no such end
  std::size_t piece = 0;    // bytes that leave at a time; 0: a unit at once
  std::string user_data;    // of every picture
  std::vector<HttpStreamFault> faults;
};

class HttpStream {
 public:
  struct Piece {
    std::chrono::nanoseconds due;  // after the stream's beginning
    std::string bytes;
  };

  // Video; `clip` is not null.
  HttpStream(std::shared_ptr<const ImageClip> clip, HttpStreamOptions options);
  // Sound: the file's bytes, `unit` at a time.
  HttpStream(std::string sound, std::size_t unit, HttpStreamOptions options);

  // The head of the answer.
  [[nodiscard]] std::string head() const;
  // What leaves next; nothing at the stream's end.
  [[nodiscard]] std::optional<Piece> next();
  // Whether the connection closes at the stream's end; else it stays, silent.
  [[nodiscard]] bool closes() const { return closes_; }

 private:
  [[nodiscard]] bool load_unit();
  [[nodiscard]] std::optional<std::string> content() const;
  [[nodiscard]] std::string unit_bytes(const std::string& content) const;
  [[nodiscard]] const HttpStreamFault* fault(HttpStreamFault::Action action) const;
  void strike();

  std::shared_ptr<const ImageClip> clip_;
  std::string sound_;
  std::size_t sound_unit_ = 0;
  HttpStreamOptions options_;
  std::uint64_t index_ = 0;       // of the unit under way
  std::uint64_t clip_began_ = 0;  // the unit that the clip began with
  std::chrono::nanoseconds due_{0};
  std::chrono::nanoseconds late_{0};
  std::string unit_;  // what has not left of it
  bool begun_ = false;
  bool ended_ = false;
  bool closes_ = true;
};

// Bytes that a second of sound has, by the camera's word of its codec ("g711_64"); 0 for an unknown one.
[[nodiscard]] std::size_t sound_rate(std::string_view codec);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_HTTP_STREAM_H_

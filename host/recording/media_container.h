// SPDX-License-Identifier: Apache-2.0
// Video in a Matroska or MP4 file, each picture with its time. Needs FFmpeg's libraries: a build without them refuses.
#ifndef HOST_RECORDING_MEDIA_CONTAINER_H_
#define HOST_RECORDING_MEDIA_CONTAINER_H_

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "host/recording/picture_target.h"

namespace vexa::host {

enum class ContainerFormat { kMatroska, kMp4 };

// The file is opened with the first picture, whose codec is that of the video. Times count from that picture, to the
// millisecond in Matroska and to 1/90000 s in MP4; two pictures never have the same. Every second of video is written
// whole, so that what a program leaves that is killed plays up to its last second; MP4 is fragmented for that. A file
// that is not closed lacks its index.
class MediaContainer final : public PictureTarget {
 public:
  MediaContainer(std::string path, ContainerFormat format);
  // Writes to a descriptor that is already open, and leaves it open.
  MediaContainer(std::string name, ContainerFormat format, int open_fd);
  ~MediaContainer() override;

  [[nodiscard]] std::optional<Problem> check() const override;
  [[nodiscard]] std::optional<Problem> write(const RecordedPicture& picture) override;
  [[nodiscard]] std::optional<Problem> close() override;
  [[nodiscard]] const std::string& path() const override { return path_; }

 private:
  class Muxer;  // FFmpeg's part

  const std::string path_;
  const ContainerFormat format_;
  const int given_fd_ = -1;
  std::unique_ptr<Muxer> muxer_;  // null before the first picture
};

}  // namespace vexa::host

#endif  // HOST_RECORDING_MEDIA_CONTAINER_H_

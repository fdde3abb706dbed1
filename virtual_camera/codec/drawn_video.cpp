#include "virtual_camera/codec/drawn_video.h"

#include <memory>
#include <utility>

namespace vexa::camera {
namespace {

std::string draw(ImageKind codec, const DrawnVideo& video, std::uint64_t index) {
  switch (codec) {
    case ImageKind::kH264:
      return draw_h264(video, index);
    case ImageKind::kMpeg4:
      return draw_mpeg4(video, index);
    case ImageKind::kJpeg:
      break;
  }
  return draw_jpeg(video, index);
}

}  // namespace

SquareColour square_colour(std::uint32_t column, std::uint32_t row) {
  constexpr int kBrightness[] = {60, 95, 130, 165, 200};
  constexpr SquareColour kTints[] = {{0, 128, 128}, {0, 108, 148}, {0, 148, 108}, {0, 116, 116}};
  const std::uint32_t x = column / kPatchSide;
  const std::uint32_t y = row / kPatchSide;
  SquareColour colour = kTints[(x + 2 * y) % 4];
  colour.y = kBrightness[(x * 7 + y * 13) % 5];
  return colour;
}

std::uint32_t changed_square(const SquareGrid& grid, std::uint64_t index) {
  return static_cast<std::uint32_t>(index * 11 % grid.size());
}

SquareColour changed_colour(std::uint64_t index) {
  constexpr int kDark = 32;
  constexpr int kBright = 224;
  return {index % 2 == 0 ? kBright : kDark, 128, 128};
}

DrawnSource::DrawnSource(ImageKind codec, const DrawnVideo& video)
    : video_(video), format_(source_format(codec, draw(codec, video, 0), video.frame_rate)) {}

std::optional<SourcePicture> DrawnSource::next() {
  SourcePicture picture;
  picture.codec = format_.codec;
  picture.key = picture.codec == ImageKind::kJpeg || index_ % static_cast<std::uint64_t>(video_.frame_rate) == 0;
  picture.bytes = std::make_shared<const std::string>(draw(picture.codec, video_, index_));
  picture.place = static_cast<std::size_t>(index_);
  picture.due = picture.stamp = steady_time(index_, format_.frames_per_second);
  ++index_;
  return picture;
}

}  // namespace vexa::camera

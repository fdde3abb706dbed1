// SPDX-License-Identifier: Apache-2.0
#include "host/commands/detection_picture.h"

#include "host/camera/live_pictures.h"
#include "host/picture/picture.h"
#include "host/picture/picture_file.h"
#include "host/recording/frame_file.h"

namespace vexa::host {

std::optional<Problem> check_picture_file(const std::string& file) {
  if (file.empty()) return usage("--out names no file", "For instance: --out windows.png.");
  if (!picture_format_of(file)) return usage("--out is not a picture file", "Its name ends with .png or .jpg.");
  if (!has_ffmpeg()) return without_ffmpeg("drawing on a picture");
  return FrameFile(file).check();
}

std::optional<Problem> draw_detection(const ModelCamera& camera, const SLibDDetectionParam& setting,
                                      const std::string& file) {
  const Result<LiveCamera*> live = camera.live();
  if (!live) return live.error();
  LiveCamera& player = **live;
  LivePictures pictures(player);
  if (auto problem = await_key_frame(player, pictures)) return problem;
  const PictureGroup group = pictures.newest();
  Result<Picture> picture = decode_picture(group.codec, group.frames);
  if (!picture) return picture.error();
  draw_windows(*picture, setting);
  const auto bytes = encode_picture(*picture, picture_format_of(file).value_or(PictureFormat::kPng));
  if (!bytes) return bytes.error();
  return write_whole_file(FrameFile(file), *bytes);
}

}  // namespace vexa::host

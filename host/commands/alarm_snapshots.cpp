// SPDX-License-Identifier: Apache-2.0
#include "host/commands/alarm_snapshots.h"

#include <fmt/format.h>

#include <algorithm>

#include "host/picture/picture_file.h"
#include "host/recording/frame_file.h"
#include "host/words/alarm_words.h"

namespace vexa::host {

AlarmSnapshots::~AlarmSnapshots() {
  over_ = true;
  if (player_.joinable()) player_.join();
}

std::optional<Problem> AlarmSnapshots::start(const ModelCamera& camera) {
  const Result<LiveCamera*> live = camera.live();
  if (!live) return live.error();
  LiveCamera& player = **live;
  pictures_.emplace(player);
  if (auto problem = await_key_frame(player, *pictures_)) return problem;
  const Codec codec = pictures_->newest().codec;
  if (!makes_jpeg_of(codec)) return without_ffmpeg(fmt::format("a picture of {}", name_of(codec)));
  player_ = std::thread([this] { play(); });
  return std::nullopt;
}

void AlarmSnapshots::play() {
  while (!over_ && !silent_) silent_ = pictures_->poll() == LivePictures::Polled::kSilent;
}

std::optional<Problem> AlarmSnapshots::take(const SLibDPinInfo& pin, const std::string& moment) {
  if (silent_) return silent_camera();
  const PictureGroup group = pictures_->newest();
  const auto bytes = jpeg_of(group.codec, group.frames);
  if (!bytes) return bytes.error();
  std::string name = moment;
  std::replace(name.begin(), name.end(), ':', '-');  // which some file systems do not take
  const std::string file = fmt::format("{}/{}-{}-{}.jpg", folder_, name, kind_of(pin), pin.number);
  auto problem = write_whole_file(FrameFile(file), *bytes);
  if (problem) problem->advice = "Make room in the folder of --snapshot-dir.";
  return problem;
}

std::optional<Problem> check_snapshot_folder(const std::string& folder) {
  if (!folder.empty() && !FrameFile(folder + "/x").check()) return std::nullopt;
  return usage("--snapshot-dir is not a folder that you can write to",
               "Create it first; several cameras can share one.");
}

}  // namespace vexa::host

// SPDX-License-Identifier: Apache-2.0
#include "session/recording_player.h"

#include <algorithm>
#include <utility>

#include "session/clock.h"
#include "session/core/failure_cause.h"
#include "vexa/failure.h"
#include "vexa/waiting.h"

namespace vexa {
namespace {

constexpr int kTurn = 100;                 // milliseconds between two looks at whether it goes on
constexpr std::int64_t kSecond = 1000000;  // microseconds
constexpr std::int64_t kLate = 500000;     // that a picture of the last second may come late
constexpr std::size_t kMostHeldBytes = std::size_t{64} << 20U;

struct Sink final : CDataSink {
  void Write(const unsigned char* data, unsigned int length) override { bytes.assign(data, data + length); }
  std::vector<unsigned char> bytes;
};

bool is_key(std::int32_t type) {
  return type == VIDEO_FRAME_JPEG || type == VIDEO_FRAME_MPEG4_KEY || type == VIDEO_FRAME_H264_KEY;
}

}  // namespace

std::string codec_to_play(const std::string& listed) {
  if (listed == "jpeg") return "JPEG";
  if (listed == "mpeg4") return "MPEG4";
  return listed == "h264" ? "H.264" : "";
}

std::optional<PlaybackEnd> RecordingPlayer::start(const SLibDEdgeStorageRecord& recording) {
  const std::string codec = codec_to_play(recording.imageCodec);
  if (codec.empty()) return PlaybackEnd::kRefused;
  if (driver_.StartEdgeStorageVideoStreaming({recording.streamName, codec, std::max(options_.scale, 1)}) == LIBD_OK) {
    return std::nullopt;
  }
  const FailureReport failure = LastFailure(driver_);
  const SessionCause cause = cause_of(failure.code, failure.text);
  if (cause == SessionCause::kNotFound) return PlaybackEnd::kGone;
  // Somebody else's playback ends.
  return is_refusal(cause) && cause != SessionCause::kBusy ? PlaybackEnd::kRefused : PlaybackEnd::kBroken;
}

PlaybackEnd RecordingPlayer::play(const SLibDEdgeStorageRecord& recording, GapCut& cut) {
  if (const auto failed = start(recording)) return *failed;
  PlaybackEnd end = PlaybackEnd::kBroken;
  Moment last = monotonic_now();
  Sink sink;
  while (orders_.goes_on()) {
    SLibDVideoFrameInfo frame;
    FrameFacts facts;
    frame.sink = &sink;
    sink.bytes.clear();
    const bool has_come = WaitForVideoFrame(driver_, kTurn);
    if (!has_come || GetCurrentVideoFrame(driver_, frame, facts) != LIBD_OK || sink.bytes.empty()) {
      const Moment quiet = monotonic_now() - last;
      if (is_quiet_end(recording, quiet.count() * 1000)) {
        end = PlaybackEnd::kOver;
        break;
      }
      if (quiet.count() > options_.silenceMilliseconds) break;
      continue;
    }
    last = monotonic_now();
    bytes_ += sink.bytes.size();
    if (has_lost(frame, facts) && !orders_.takes_losses) break;
    latest_ = static_cast<std::int64_t>(frame.seconds) * kSecond + frame.microseconds;
    const std::uint64_t hash = hash_of(sink.bytes.data(), sink.bytes.size());
    held_.push_back({next_++, static_cast<std::int32_t>(frame.frameType), latest_, std::move(sink.bytes)});
    sink.bytes = {};
    if (!give(cut.add(hash, is_key(held_.back().type), latest_), cut)) continue;
    end = PlaybackEnd::kOver;
    break;
  }
  driver_.StopVideoStreaming();
  // What is held back comes again with the next playback, where there is one.
  if (orders_.goes_on() && (end == PlaybackEnd::kOver || orders_.takes_losses)) give(cut.end(), cut);
  return end;
}

// A playback begins with a key picture.
bool RecordingPlayer::has_lost(const SLibDVideoFrameInfo& frame, const FrameFacts& facts) const {
  if (next_ == 0) return !is_key(static_cast<std::int32_t>(frame.frameType));
  const bool is_known = (facts.valid & FRAME_FACTS_LOSS) != 0;
  return is_known && facts.packetsLostBefore + facts.framesLostBefore != 0;
}

// Cameras do not report the end of a playback: it has ended when a picture of the recording's last second has come and
// that second is over.
bool RecordingPlayer::is_quiet_end(const SLibDEdgeStorageRecord& recording, std::int64_t quiet) const {
  if (next_ == 0 || latest_ < recording.end * kSecond) return false;
  const std::int64_t to_come = std::max<std::int64_t>((recording.end + 1) * kSecond - latest_, 0);
  return quiet > to_come / std::max(options_.scale, 1) + kLate;
}

bool RecordingPlayer::give(const GapCut::Verdict& verdict, const GapCut& cut) {
  const auto find = [this](std::size_t number) {
    return std::find_if(held_.begin(), held_.end(), [number](const Held& held) { return held.number == number; });
  };
  for (const std::size_t number : verdict.lead) {
    if (const auto picture = find(number); picture != held_.end()) give_one(*picture, cut, true);
  }
  for (const std::size_t number : verdict.take) {
    if (const auto picture = find(number); picture != held_.end()) give_one(*picture, cut, false);
  }
  while (!held_.empty() && held_.front().number < verdict.forget) held_.pop_front();
  // A clock that is far off would hold a whole recording: the oldest go first.
  std::size_t bytes = 0;
  for (const Held& held : held_) bytes += held.bytes.size();
  for (; bytes > kMostHeldBytes; held_.pop_front()) bytes -= held_.front().bytes.size();
  return verdict.over;
}

void RecordingPlayer::give_one(const Held& picture, const GapCut& cut, bool leads_in) {
  BackfillFrame frame;
  frame.frameType = picture.type;
  frame.data = picture.bytes.data();
  frame.length = picture.bytes.size();
  frame.cameraTime = picture.camera_time;
  frame.time = cut.host_time(picture.camera_time);
  frame.isKey = is_key(picture.type);
  frame.isFirst = std::exchange(is_first_, false);
  frame.leadsIn = leads_in;
  orders_.deliver(frame);
}

}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
// Frames from the pictures of an RTP session.
#include <chrono>
#include <optional>
#include <utility>

#include "device/driver_state.h"
#include "media/assembly/elementary_unit.h"
#include "media/assembly/picture_clock.h"
#include "media/assembly/rtp_pictures.h"
#include "media/frame_chronicle.h"
#include "transport/wire/rtp_header.h"

namespace {

constexpr unsigned int kLeastCapacity = 4;

ELibDReturnCode code_of(vexa::Assembly outcome) {
  switch (outcome) {
    case vexa::Assembly::kWhole:
      return LIBD_OK;
    case vexa::Assembly::kUnsupported:
      return LIBD_FAILED;
    case vexa::Assembly::kTooLarge:
      return LIBD_BUFFER_TOO_SMALL;
  }
  return LIBD_FAILED;
}

}  // namespace

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrame(const std::string& codec, VideoFrameInfo& frame) {
  if (m_State->stream_socket() == -1) return LIBD_FAILED;
  const vexa::Codec* known = vexa::codec_named(codec);
  if (known == nullptr) return LIBD_FAILED;
  switch (known->kind) {
    case vexa::CodecKind::kJpeg:
      return GetRtpCurrentVideoFrameJPEG(frame);
    case vexa::CodecKind::kMpeg4:
      return GetRtpCurrentVideoFrameMPEG4(frame);
    case vexa::CodecKind::kH264:
      return GetRtpCurrentVideoFrameH264(frame);
  }
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrameH264(VideoFrameInfo& frame) {
  const ELibDReturnCode begun = m_State->begin_rtp_frame(frame, vexa::kH264Codec);
  if (begun != LIBD_OK) return begun;
  vexa::PacketRunPlace run;
  const ELibDReturnCode collected = m_State->collect_picture(run);
  if (collected != LIBD_OK) return collected;
  const vexa::PacketRun packets = m_State->rtp->collector.packets(run);
  for (const SPacketInfo& packet : packets) {
    const vexa::Bytes unit = vexa::supplemental_information(packet);
    if (!unit.empty()) GetUserDataFromStream(unit.data(), static_cast<unsigned int>(unit.size()));
  }
  return m_State->finish_rtp_frame(frame, run, vexa::assemble_h264(packets, {frame.data, frame.capacity}));
}

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrameMPEG4(VideoFrameInfo& frame) {
  const ELibDReturnCode begun = m_State->begin_rtp_frame(frame, vexa::kMpeg4Codec);
  if (begun != LIBD_OK) return begun;
  vexa::PacketRunPlace run;
  const ELibDReturnCode collected = m_State->collect_picture(run);
  if (collected != LIBD_OK) return collected;
  const vexa::PacketRun packets = m_State->rtp->collector.packets(run);
  const ELibDReturnCode finished =
      m_State->finish_rtp_frame(frame, run, vexa::assemble_mpeg4(packets, {frame.data, frame.capacity}));
  GetUserDataFromStream(frame.data, frame.length);
  return finished;
}

// Kept: a damaged picture is an empty frame of type 0, by which the host notices it.
ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrameJPEG(VideoFrameInfo& frame) {
  const ELibDReturnCode begun = m_State->begin_rtp_frame(frame, vexa::kJpegCodec);
  if (begun != LIBD_OK) return begun;
  frame.frameType = VIDEO_FRAME_JPEG;
  vexa::PacketRunPlace run;
  const ELibDReturnCode collected = m_State->collect_picture(run);
  if (collected != LIBD_OK) return collected;
  const vexa::PacketRun packets = m_State->rtp->collector.packets(run);
  const SPacketInfo& first = packets.front();
  if (first.length > vexa::kJpegFirstPacketRoom) {
    m_State->rtp->refused = vexa::name_of(first);
    return LIBD_FRAME_DAMAGED;
  }
  unsigned char beginning[vexa::kJpegFirstPacketRoom];
  unsigned int length = 0;
  if (!RTPJpegToJIF(beginning, &length, first.data + vexa::kRtpHeaderSize,
                    static_cast<unsigned int>(vexa::payload_of(first).size()))) {
    m_State->rtp->collector.abandon(run);
    return LIBD_FRAME_DAMAGED;
  }
  return m_State->finish_rtp_frame(
      frame, run, vexa::assemble_jpeg({beginning, length}, packets.subspan(1), {frame.data, frame.capacity}));
}

bool CVexaCommon::RTPJpegToJIF(unsigned char* out, unsigned int* outLength, unsigned char* payload,
                               unsigned int length) {
  const vexa::Bytes first(payload, length);
  if (vexa::leads_with_user_data(first)) GetUserDataFromStream(payload, length);
  const auto written = vexa::begin_jfif({out, vexa::kJpegFirstPacketRoom}, first);
  if (!written) return false;
  *outLength = *written;
  return true;
}

bool CVexaCommon::GetUserDataFromStream(const unsigned char* data, unsigned int length) {
  return m_State->store_position(vexa::front_of_user_data({data, length}));
}

namespace vexa {

bool DriverState::store_position(Bytes data) {
  const auto position = camera_position(data);
  if (!position) return false;
  const Guard guard(driver.m_CamPosLock);
  driver.m_CamPosText = *position;
  return true;
}

ELibDReturnCode DriverState::begin_rtp_frame(CVexaCommon::VideoFrameInfo& frame, const Codec& codec) {
  if (driver.m_RtpPacketBuffer == nullptr) return LIBD_NO_FRAME;
  frame.length = 0;
  if (frame.capacity < kLeastCapacity) return LIBD_FAILED;
  begin_frame();
  if (rtp->codec.kind == codec.kind) return LIBD_OK;
  rtp->collector.discard_all();  // of another codec
  rtp = std::make_unique<RtpReception>(driver.m_RtpPackets, codec, ledger.collection());
  return LIBD_OK;
}

void DriverState::begin_frame() {
  if (ready_frame.data == nullptr) return;
  ready_frame.data = nullptr;
  ledger.frame_taken();
}

void DriverState::frame_is_ready(const CVexaCommon::VideoFrameInfo& frame, const Codec& codec,
                                 const FrameFacts& facts) {
  ready_frame = {frame.data, false, facts};
  ledger.frame_ready(frame.frameType == codec.key_frame, std::chrono::steady_clock::now());
  ledger.publish();
}

std::optional<Errand> DriverState::errand() const {
  if (!keep_alive) return std::nullopt;
  return Errand{keep_alive->begun ? -1 : driver.m_RtspSocket, keep_alive->give_up};
}

ELibDReturnCode DriverState::collect_picture(PacketRunPlace& run) {
  errors.clear();
  rtp->gather.limit(prompt_frames ? BurstGather::kPrompt : BurstGather::kLongest);
  PictureReader reader(*rtp, ledger, *chronicle,
                       {stream_source(), driver.m_RtpPacketBuffer, driver.m_RtpClockRate, connection.timeout(),
                        [this] { return stop_is_requested(); }, strict_reception, errand()});
  const auto picture = rtp->codec.kind == CodecKind::kJpeg ? reader.next_jpeg() : reader.next();
  if (!picture) {
    const Failure& failure = picture.failure();
    errors.record(failure);
    return failure.code == LIBD_TIMEOUT || stop_is_requested() ? nothing_yet() : failure.code;
  }
  if (!*picture) return nothing_yet();
  run = **picture;
  return LIBD_OK;
}

ELibDReturnCode DriverState::finish_rtp_frame(CVexaCommon::VideoFrameInfo& frame, PacketRunPlace run,
                                              const AssembledPicture& picture) {
  PacketCollector& collector = rtp->collector;
  const std::uint32_t timestamp = collector.packets(run).front().timestamp;
  if (picture.outcome != Assembly::kWhole) {
    collector.abandon(run, picture.outcome == Assembly::kTooLarge ? PictureLoss::kTooLarge : PictureLoss::kDamaged);
    ledger.publish();
    return code_of(picture.outcome);
  }
  frame.length = picture.length;
  frame.frameType = picture.frame_type;
  driver.m_LastFrameTime = now();
  stamp_picture(frame, timestamp);
  const PacketRun packets = collector.packets(run);
  const FrameFacts facts = facts_of(frame, rtp->codec, packets);
  collector.use(run);
  frame_is_ready(frame, rtp->codec, facts);
  return LIBD_OK;
}

FrameFacts DriverState::facts_of(const CVexaCommon::VideoFrameInfo& frame, const Codec& codec, PacketRun packets) {
  FrameChronicle::Picture picture{codec.kind,
                                  packets.empty() ? nullptr : &packets.front(),
                                  packets.empty() ? nullptr : &packets.back(),
                                  {frame.data, frame.length},
                                  frame.frameType == codec.key_frame,
                                  driver.m_RtpClockRate,
                                  std::nullopt};
  if (driver.m_EdgeStoragePlayback) {
    constexpr std::int64_t kNanosecondsASecond = 1'000'000'000;
    constexpr std::int64_t kNanosecondsAMicrosecond = 1000;
    picture.range_time = frame.seconds * kNanosecondsASecond + frame.microseconds * kNanosecondsAMicrosecond;
  }
  return chronicle->facts_of(picture);
}

void DriverState::stamp_picture(CVexaCommon::VideoFrameInfo& frame, std::uint32_t timestamp) {
  PictureTime time;
  if (driver.m_EdgeStoragePlayback && driver.m_FirstPlaybackFrame) {
    driver.m_FirstPlaybackFrame = false;
    driver.m_PlaybackBaseTimestamp = timestamp;
    time = {driver.m_RangeClockSeconds, driver.m_RangeClockMicros};
  } else if (driver.m_EdgeStoragePlayback) {
    time = picture_time({driver.m_RangeClockSeconds, driver.m_RangeClockMicros},
                        timestamp - driver.m_PlaybackBaseTimestamp, driver.m_RtpClockRate);
  }
  frame.seconds = static_cast<std::int32_t>(time.seconds);
  frame.microseconds = static_cast<std::int32_t>(time.microseconds);
  if (!driver.m_EdgeStoragePlayback || timestamp >= driver.m_PlaybackBaseTimestamp) return;
  // Kept: a picture before the base moves it, after its own stamp came from the wrapped difference.
  driver.m_PlaybackBaseTimestamp = timestamp;
  driver.m_RangeClockSeconds = time.seconds;
  driver.m_RangeClockMicros = static_cast<int>(time.microseconds);
}

}  // namespace vexa

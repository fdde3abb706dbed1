// CVexaCommon: frames from the pictures of an RTP session.
#include <memory>
#include <optional>
#include <utility>

#include "device/driver_state.h"
#include "media/assembly/h264_units.h"
#include "media/assembly/mpeg4_units.h"
#include "media/assembly/picture_clock.h"
#include "media/assembly/rtp_jpeg.h"
#include "transport/wire/rtp_header.h"
#include "vexa/vexa_common.h"

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

vexa::PictureName name_of(const SPacketInfo& first) { return {first.timestamp, first.sequence}; }

}  // namespace

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrame(const std::string& codec, VideoFrameInfo& frame) {
  if (m_StreamSocket == -1) return LIBD_FAILED;
  if (codec == "JPEG") return GetRtpCurrentVideoFrameJPEG(frame);
  if (codec == "MPEG4") return GetRtpCurrentVideoFrameMPEG4(frame);
  if (codec == "H.264") return GetRtpCurrentVideoFrameH264(frame);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrameH264(VideoFrameInfo& frame) {
  const ELibDReturnCode begun = BeginRtpFrame(frame, vexa::kH264Rules);
  if (begun != LIBD_OK) return begun;
  vexa::PacketRunPlace run;
  const ELibDReturnCode collected = CollectPicture(run);
  if (collected != LIBD_OK) return collected;
  const vexa::PacketRun packets = m_State->rtp->collector.packets(run);
  for (const SPacketInfo& packet : packets) {
    const vexa::Bytes unit = vexa::supplemental_information(packet);
    if (!unit.empty()) GetUserDataFromStream(unit.data(), static_cast<unsigned int>(unit.size()));
  }
  return FinishRtpFrame(frame, run, vexa::assemble_h264(packets, {frame.data, frame.capacity}));
}

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrameMPEG4(VideoFrameInfo& frame) {
  const ELibDReturnCode begun = BeginRtpFrame(frame, vexa::kMpeg4Rules);
  if (begun != LIBD_OK) return begun;
  vexa::PacketRunPlace run;
  const ELibDReturnCode collected = CollectPicture(run);
  if (collected != LIBD_OK) return collected;
  const vexa::PacketRun packets = m_State->rtp->collector.packets(run);
  const ELibDReturnCode finished =
      FinishRtpFrame(frame, run, vexa::assemble_mpeg4(packets, {frame.data, frame.capacity}));
  GetUserDataFromStream(frame.data, frame.length);
  return finished;
}

// Kept: a damaged picture is an empty frame of type 0, by which the host learns of it.
ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrameJPEG(VideoFrameInfo& frame) {
  const ELibDReturnCode begun = BeginRtpFrame(frame, vexa::kJpegRules);
  if (begun != LIBD_OK) return begun;
  frame.frameType = VIDEO_FRAME_JPEG;
  vexa::PacketRunPlace run;
  const ELibDReturnCode collected = CollectJpegPicture(run);
  if (collected != LIBD_OK) return collected;
  const vexa::PacketRun packets = m_State->rtp->collector.packets(run);
  const SPacketInfo& first = packets.front();
  if (first.length > vexa::kJpegFirstPacketRoom) {
    m_State->rtp->refused = name_of(first);
    return LIBD_FRAME_DAMAGED;
  }
  unsigned char beginning[vexa::kJpegFirstPacketRoom];
  unsigned int length = 0;
  if (!RTPJpegToJIF(beginning, &length, first.data + vexa::kRtpHeaderSize,
                    static_cast<unsigned int>(vexa::payload_of(first).size()))) {
    m_State->rtp->collector.abandon(run);
    return LIBD_FRAME_DAMAGED;
  }
  return FinishRtpFrame(frame, run,
                        vexa::assemble_jpeg({beginning, length}, packets.subspan(1), {frame.data, frame.capacity}));
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

// Kept: a picture whose first packet is too long is told damaged while it stays listed, and is taken out when it is met
// again, one read later.
ELibDReturnCode CVexaCommon::CollectJpegPicture(vexa::PacketRunPlace& run) {
  vexa::RtpReception& rtp = *m_State->rtp;
  const auto refused = std::exchange(rtp.refused, std::nullopt);
  if (refused) ReceivePacket(0);
  const ELibDReturnCode collected = CollectPicture(run);
  if (collected != LIBD_OK || !refused || name_of(rtp.collector.packets(run).front()) != *refused) return collected;
  rtp.collector.abandon(run);
  return CollectPicture(run);
}

ELibDReturnCode CVexaCommon::BeginRtpFrame(VideoFrameInfo& frame, const vexa::PictureRules& rules) {
  if (m_RtpPacketBuffer == nullptr) return LIBD_NO_FRAME;
  frame.length = 0;
  if (frame.capacity < kLeastCapacity) return LIBD_FAILED;
  if (&m_State->rtp->rules == &rules) return LIBD_OK;
  m_RtpPackets.clear();  // of another codec
  m_State->rtp = std::make_unique<vexa::RtpReception>(m_RtpPackets, rules);
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::FinishRtpFrame(VideoFrameInfo& frame, vexa::PacketRunPlace run,
                                            const vexa::AssembledPicture& picture) {
  vexa::PacketCollector& collector = m_State->rtp->collector;
  const std::uint32_t timestamp = collector.packets(run).front().timestamp;
  if (picture.outcome != vexa::Assembly::kWhole) {
    collector.abandon(run);
    return code_of(picture.outcome);
  }
  collector.use(run);
  frame.length = picture.length;
  frame.frameType = picture.frame_type;
  m_LastFrameTime = m_State->now();
  StampPicture(frame, timestamp);
  return LIBD_OK;
}

void CVexaCommon::StampPicture(VideoFrameInfo& frame, std::uint32_t timestamp) {
  vexa::PictureTime time;
  if (m_EdgeStoragePlayback && m_FirstPlaybackFrame) {
    m_FirstPlaybackFrame = false;
    m_PlaybackBaseTimestamp = timestamp;
    time = {m_RangeClockSeconds, m_RangeClockMicros};
  } else if (m_EdgeStoragePlayback) {
    time = vexa::picture_time({m_RangeClockSeconds, m_RangeClockMicros}, timestamp - m_PlaybackBaseTimestamp,
                              m_RtpClockRate);
  }
  frame.seconds = static_cast<std::int32_t>(time.seconds);
  frame.microseconds = static_cast<std::int32_t>(time.microseconds);
  if (!m_EdgeStoragePlayback || timestamp >= m_PlaybackBaseTimestamp) return;
  // Kept: a picture before the base moves it, after its own stamp came from the wrapped difference.
  m_PlaybackBaseTimestamp = timestamp;
  m_RangeClockSeconds = time.seconds;
  m_RangeClockMicros = static_cast<int>(time.microseconds);
}

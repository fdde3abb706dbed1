// CVexaCommon: frames from the pictures of an RTP session.
#include "device/driver_state.h"
#include "media/assembly/h264_units.h"
#include "media/assembly/picture_clock.h"
#include "transport/wire/packet_order.h"
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

}  // namespace

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrame(const std::string& codec, VideoFrameInfo& frame) {
  if (m_StreamSocket == -1) return LIBD_FAILED;
  if (codec == "H.264") return GetRtpCurrentVideoFrameH264(frame);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetRtpCurrentVideoFrameH264(VideoFrameInfo& frame) {
  if (m_RtpPacketBuffer == nullptr) return LIBD_NO_FRAME;
  frame.length = 0;
  if (frame.capacity < kLeastCapacity) return LIBD_FAILED;
  vexa::PacketRunPlace run;
  const ELibDReturnCode collected = CollectPicture(run);
  if (collected != LIBD_OK) return collected;
  vexa::PacketCollector& collector = m_State->rtp->collector;
  const vexa::PacketRun packets = collector.packets(run);
  const std::uint32_t timestamp = packets.front().timestamp;
  const vexa::AssembledPicture picture = vexa::assemble_h264(packets, {frame.data, frame.capacity});
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

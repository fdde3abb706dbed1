// When a frame was taken and how it came: RTP time, sequence, arrival, losses, the camera's clock.
#pragma once

#include <cstdint>

#include "vexa/export.h"
#include "vexa/return_codes.h"

class CVexaCommon;
struct SLibDVideoFrameInfo;

namespace vexa {

/// Bits of FrameFacts::valid: which facts are known. 0 is a value like any other of a fact that is.
enum FrameFactsValid : std::uint32_t {
  FRAME_FACTS_RTP_TIME = 1u << 0,      ///< rtpTime, unwrappedRtpTime
  FRAME_FACTS_SEQUENCE = 1u << 1,      ///< firstSequence, lastSequence
  FRAME_FACTS_ARRIVAL = 1u << 2,       ///< the four arrivals and their source
  FRAME_FACTS_KEY_PICTURE = 1u << 3,   ///< keyPicture
  FRAME_FACTS_LOSS = 1u << 4,          ///< packetsLostBefore (RTP only), framesLostBefore
  FRAME_FACTS_CONTINUITY = 1u << 5,    ///< discontinuity
  FRAME_FACTS_SENDER_TIME = 1u << 6,   ///< senderTime, its uncertainty, source and epoch
  FRAME_FACTS_CAMERA_CLOCK = 1u << 7,  ///< cameraClockOffset and what else begins with cameraClock, but for the rate
  FRAME_FACTS_CLOCK_RATE = 1u << 8     ///< cameraClockRate
};

/// Who took an arrival's time.
enum FrameArrivalSource : std::uint32_t {
  FRAME_ARRIVAL_HOST = 0,   ///< the thread that read the packet, up to some milliseconds after it came
  FRAME_ARRIVAL_KERNEL = 1  ///< the kernel, as it came
};

/// Bits of FrameFacts::discontinuity: why this frame does not go on where the one before it ended.
enum FrameDiscontinuity : std::uint32_t {
  FRAME_DISCONTINUITY_START = 1u << 0,             ///< the first frame of a start
  FRAME_DISCONTINUITY_SSRC = 1u << 1,              ///< the sender has another SSRC
  FRAME_DISCONTINUITY_SEQUENCE_RESTART = 1u << 2,  ///< the sender began its sequence numbers again
  FRAME_DISCONTINUITY_TIME_JUMP = 1u << 3,         ///< RTP time went back, or ahead by 10 s more than passed
  FRAME_DISCONTINUITY_CODEC = 1u << 4,             ///< another codec
  /// Another picture size; of H.264 and MPEG-4 any change of the sequence header that a size stands in.
  FRAME_DISCONTINUITY_SIZE = 1u << 5
};

/// Where FrameFacts::senderTime comes from.
enum FrameSenderTimeSource : std::uint32_t {
  FRAME_SENDER_TIME_NONE = 0,
  FRAME_SENDER_TIME_REPORT = 1,  ///< RTCP sender reports: the camera's clock
  FRAME_SENDER_TIME_RANGE = 2    ///< the range clock of a recording, as SLibDVideoFrameInfo has it
};

/// What the camera's clock is doing (FrameFacts::cameraClockState).
enum FrameCameraClockState : std::uint32_t {
  FRAME_CAMERA_CLOCK_RUNNING = 0,
  FRAME_CAMERA_CLOCK_FROZEN = 1,     ///< report after report has the same time; no sender time is given
  FRAME_CAMERA_CLOCK_LOCAL_TIME = 2  ///< off by a multiple of 15 minutes: local time sent as UTC
};

/// Times are nanoseconds; real times count from 1970 UTC, monotonic ones as CLOCK_MONOTONIC does.
struct FrameFacts {
  /// In: the bytes of this record as the host was compiled; no more is filled. Out: those that were.
  std::uint32_t size = sizeof(FrameFacts);
  std::uint32_t valid = 0;  ///< FrameFactsValid bits

  std::uint32_t rtpTime = 0;          ///< as sent, in ticks of the RTP clock
  std::uint32_t keyPicture = 0;       ///< 1: can be shown without those before it
  std::int64_t unwrappedRtpTime = 0;  ///< without its wraps at 2^32; begins as sent, once a start or SSRC
  std::uint64_t firstSequence = 0;    ///< extended sequence number of its first packet; ascends in a stream
  std::uint64_t lastSequence = 0;

  std::int64_t firstArrivalRealTime = 0;
  std::int64_t lastArrivalRealTime = 0;
  std::int64_t firstArrivalMonotonicTime = 0;
  std::int64_t lastArrivalMonotonicTime = 0;
  std::uint32_t arrivalSource = FRAME_ARRIVAL_HOST;  ///< a FrameArrivalSource
  std::uint32_t discontinuity = 0;                   ///< FrameDiscontinuity bits; 0: goes on

  std::uint64_t packetsLostBefore = 0;  ///< between it and the frame handed out before: in no frame handed out
  std::uint64_t framesLostBefore = 0;   ///< of which some packet came, and that were not handed out

  std::int64_t senderTime = 0;              ///< when it was sampled, by the sender's clock
  std::uint64_t senderTimeUncertainty = 0;  ///< of the mapping from RTP time; the clock may be wrong by any amount
  std::uint32_t senderTimeSource = FRAME_SENDER_TIME_NONE;  ///< a FrameSenderTimeSource
  std::uint32_t senderTimeEpoch = 0;                        ///< raised when the sender's clock or SSRC changed

  /// The camera's clock less the host's, delay on the way included: the largest of the latest reports, since that is
  /// the one that came with the least delay.
  std::int64_t cameraClockOffset = 0;
  std::int32_t cameraClockRate = 0;              ///< how much faster than the host's it runs, in parts of 10^9
  std::int32_t cameraClockLocalTimeMinutes = 0;  ///< with FRAME_CAMERA_CLOCK_LOCAL_TIME: ahead of UTC
  std::uint32_t cameraClockState = FRAME_CAMERA_CLOCK_RUNNING;  ///< a FrameCameraClockState
  std::uint32_t cameraClockSteps = 0;                           ///< how often it was set since the start
};

/// As CVexaCommon::GetCurrentVideoFrame, whose result, record and sink call are the same whatever the facts; and what
/// is known of the frame. Any thread. Without a frame `facts` has no valid bit. No clock of a camera drops, delays or
/// reorders a frame. Set `facts.size` as its constructor does.
VEXA_API ELibDReturnCode GetCurrentVideoFrame(CVexaCommon& driver, SLibDVideoFrameInfo& frame, FrameFacts& facts);

}  // namespace vexa

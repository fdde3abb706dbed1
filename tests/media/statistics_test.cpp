// What a driver's counts are after packets and frames of each fate.
#include "vexa/statistics.h"

#include <gtest/gtest.h>

#include <cstring>

#include "tests/media/rtp_feed.h"
#include "tests/media/statistics_equations.h"
#include "vexa/frame_facts.h"
#include "vexa/reception.h"

namespace vexa_test {
namespace {

const Payload kIdr = {0x65, 0x88, 1, 2};
const Payload kSlice = {0x41, 0x9a, 3};

class Statistics : public RtpFeed {
 protected:
  vexa::StreamStatistics now() {
    const vexa::StreamStatistics statistics = statistics_of(driver_);
    expect_equations(statistics);
    expect_not_fallen(last_, statistics);
    last_ = statistics;
    return statistics;
  }
  /// What the streaming thread does with a frame that it has read.
  void queue(ELibDReturnCode result) {
    auto* copy = new unsigned char[frame_.capacity];
    std::copy(buffer_.begin(), buffer_.begin() + frame_.length, copy);
    CVexaCommon::VideoFrameInfo queued = frame_;
    queued.data = copy;
    if (result == LIBD_OK) driver_.state().ready_frame.data = copy;
    MediaDriver::ProcessCurrentFrameData(&driver_, queued, wait_key_, result);
  }
  ELibDReturnCode take() {
    SLibDVideoFrameInfo info;
    return driver_.GetCurrentVideoFrame(info);
  }
  void send_raw(const Payload& datagram) {
    EXPECT_EQ(send(camera_, datagram.data(), datagram.size(), 0), static_cast<ssize_t>(datagram.size()));
  }
  /// An RTP datagram of its own SSRC.
  void send_from(std::uint8_t ssrc, unsigned sequence, const Payload& payload) {
    Payload datagram = rtp_datagram({true, payload_type_, sequence, timestamp_}, payload);
    datagram[11] = ssrc;
    send_raw(datagram);
  }
  void read_all() {
    while (read() == LIBD_OK) {
    }
  }

  bool wait_key_ = false;
  vexa::StreamStatistics last_;
};

TEST_F(Statistics, AreZeroBeforeAnythingHasCome) {
  const vexa::StreamStatistics s = now();
  EXPECT_EQ(s.size, sizeof s);
  EXPECT_EQ(s.packetsReceived, 0u);
  EXPECT_EQ(s.framesBegun, 0u);
  EXPECT_EQ(s.timeSinceLastPacket, UINT64_MAX);
  EXPECT_EQ(s.timeSinceLastFrame, UINT64_MAX);
  EXPECT_EQ(s.transport, vexa::STREAM_TRANSPORT_UDP);
}

TEST_F(Statistics, AFrameIsFollowedFromItsPacketsToTheHost) {
  send_picture({kIdr});
  send_picture({kSlice, kSlice});
  ASSERT_EQ(read(), LIBD_OK);
  EXPECT_EQ(now().framesHeldInQueue, 1u) << "on its way";
  queue(LIBD_OK);
  ASSERT_EQ(read(), LIBD_OK);
  queue(LIBD_OK);
  EXPECT_EQ(now().framesHeldInQueue, 2u);
  ASSERT_EQ(take(), LIBD_OK);
  const vexa::StreamStatistics s = now();
  EXPECT_EQ(s.packetsReceived, 3u);
  EXPECT_EQ(s.bytesReceived, 3 * 12u + 4 + 3 + 3);
  EXPECT_EQ(s.packetsUsed, 3u);
  EXPECT_EQ(s.packetsExpected, 3u);
  EXPECT_EQ(s.framesBegun, 2u);
  EXPECT_EQ(s.framesAssembled, 2u);
  EXPECT_EQ(s.keyFrames, 1u);
  EXPECT_EQ(s.framesHandedOut, 1u);
  EXPECT_EQ(s.framesHeldInQueue, 1u);
  EXPECT_LT(s.timeSinceLastFrame, 60000000u);
}

TEST_F(Statistics, FramesThatTheReaderTakesItselfAreHandedOut) {
  send_picture({kIdr});
  send_picture({kSlice});
  ASSERT_EQ(read(), LIBD_OK);
  ASSERT_EQ(read(), LIBD_OK);
  const vexa::StreamStatistics s = now();
  EXPECT_EQ(s.framesAssembled, 2u);
  EXPECT_EQ(s.framesHandedOut + s.framesHeldInQueue, 2u);
}

TEST_F(Statistics, EachDiscardedPacketHasItsReason) {
  send_picture({kIdr});
  send_packet(kSlice, Marker::kUnset);
  --sequence_;
  send_packet(kSlice, Marker::kUnset);  // again
  send_raw({0x80, 0x60, 1});            // no header
  send_raw(Payload(70000, 0x80));       // no datagram over IPv4
  read_all();
  vexa::StreamStatistics s = now();
  EXPECT_EQ(s.packetsDuplicated, 1u);
  EXPECT_EQ(s.packetsDiscardedNotRtp, 1u);
  EXPECT_EQ(s.packetsDiscardedTruncated, 1u);
  EXPECT_EQ(s.packetsHeld, 1u);
  EXPECT_EQ(s.framesHeldInAssembly, 1u);
  driver_.ReleaseRtpPacketsPtr();
  s = now();
  EXPECT_EQ(s.packetsDiscardedAfterStop, 1u);
  EXPECT_EQ(s.framesDroppedAfterStop, 1u);
  EXPECT_EQ(s.packetsHeld, 0u);
  ASSERT_TRUE(driver_.state().allocate_packets());
}

TEST_F(Statistics, AMissingPacketIsMissingUntilItComes) {
  send_picture({kIdr});
  const unsigned lost = sequence_++;
  send_picture({kSlice});
  read_all();
  EXPECT_EQ(now().packetsMissing, 1u);
  EXPECT_EQ(now().packetsMissingInCamera, 0u);
  timestamp_ -= 3600;
  sequence_ = lost;
  send_packet(kSlice, Marker::kUnset);
  read_all();
  const vexa::StreamStatistics s = now();
  EXPECT_EQ(s.packetsMissing, 0u);
  EXPECT_EQ(s.packetsLate, 1u);
  EXPECT_EQ(s.packetsExpected, 3u);
}

TEST_F(Statistics, DroppedFramesHaveTheirReasons) {
  send_picture({kSlice});  // without key
  send_picture({kIdr});
  send_picture({{0x78, 1, 2}});  // an aggregation packet, which is not read: damaged
  read_all();
  EXPECT_EQ(now().framesDroppedWithoutKey, 1u);
  EXPECT_EQ(now().framesDroppedDamaged, 1u);
  send_picture({kIdr});
  frame_.capacity = 7;
  EXPECT_EQ(read(), LIBD_BUFFER_TOO_SMALL);
  EXPECT_EQ(now().framesDroppedTooLarge, 1u);
}

TEST_F(Statistics, AFullQueueAndAStopDropFrames) {
  send_picture({kIdr});
  ASSERT_EQ(read(), LIBD_OK);
  queue(LIBD_OK);
  for (int i = 0; i < 31; ++i) {
    send_picture({kSlice});
    ASSERT_EQ(read(), LIBD_OK);
    queue(LIBD_OK);
    now();
  }
  vexa::StreamStatistics s = now();
  EXPECT_EQ(s.framesDroppedQueue, 31u);
  EXPECT_EQ(s.framesDroppedWithoutKey, 1u) << "the one that found the queue full";
  send_picture({kIdr});
  ASSERT_EQ(read(), LIBD_OK);
  queue(LIBD_OK);
  driver_.state().clear_frame_queue();
  s = now();
  EXPECT_EQ(s.framesDroppedAfterStop, 1u);
  EXPECT_EQ(s.framesHeldInQueue, 0u);
}

TEST_F(Statistics, ANoticeOfADamagedPictureIsNoFrame) {
  frame_.length = 0;
  frame_.frameType = VIDEO_FRAME_JPEG;
  queue(LIBD_FRAME_DAMAGED);
  EXPECT_EQ(take(), LIBD_OK);
  EXPECT_EQ(now().framesBegun, 0u);
}

TEST_F(Statistics, AFrameThatAModelClassQueuesIsBegunThere) {
  CVexaCommon::VideoFrameInfo made;
  made.data = new unsigned char[8];
  made.capacity = 8;
  made.frameType = VIDEO_FRAME_H264_KEY;
  {
    const vexa::Guard guard(driver_.m_FrameQueueLock);
    MediaDriver::PropulateFrameInfoList(&driver_, made, wait_key_);
  }
  EXPECT_EQ(now().framesBegun, 1u);
  EXPECT_EQ(take(), LIBD_OK);
  EXPECT_EQ(now().framesHandedOut, 1u);
}

TEST_F(Statistics, AStartAndANewSsrcRaiseTheEpochAndTotalsStay) {
  const std::uint64_t epoch = now().epoch;
  send_from(1, 1, kIdr);
  read_all();
  EXPECT_EQ(now().epoch, epoch);
  send_from(2, 500, kIdr);
  read_all();
  EXPECT_EQ(now().epoch, epoch) << "a single packet of another source";
  send_from(2, 501, kIdr);
  read_all();
  EXPECT_EQ(now().epoch, epoch + 1);
  EXPECT_EQ(now().packetsExpected, 3u);
  ASSERT_TRUE(driver_.state().allocate_packets());
  EXPECT_EQ(now().epoch, epoch + 2);
  EXPECT_EQ(now().packetsReceived, 3u);
}

TEST_F(Statistics, StrictReceptionRefusesAnotherSsrcOnceOneIsLearnt) {
  vexa::SetStrictReception(driver_, true);
  send_from(1, 1, kIdr);
  send_from(2, 2, kSlice);
  send_from(2, 3, kSlice);
  read_all();
  EXPECT_EQ(now().packetsDiscardedForeignSsrc, 2u);
  EXPECT_EQ(now().packetsUsed, 1u);
  vexa::SetStrictReception(driver_, false);
  send_from(2, 4, kSlice);
  read_all();
  EXPECT_EQ(now().packetsDiscardedForeignSsrc, 2u);
}

TEST_F(Statistics, AnotherPayloadTypeIsCountedWhereTheCodecHasOne) {
  codec_ = "JPEG";
  send_packet(kSlice, Marker::kSet);
  read_all();
  EXPECT_EQ(now().packetsDiscardedWrongPayloadType, 1u);
}

TEST_F(Statistics, OverwrittenPacketsAreCountedSo) {
  send_picture({kIdr});
  read_all();
  // Pieces of one picture that never ends, more than the buffer holds.
  const Payload piece(60000, 0x41);
  for (int i = 0; i < 40; ++i) {
    send_packet(piece, Marker::kUnset);
    read();
    now();
  }
  EXPECT_GT(now().packetsDiscardedOverwritten, 0u);
}

TEST_F(Statistics, AnOlderHostsRecordIsFilledUpToItsEnd) {
  send_picture({kIdr});
  read_all();
  vexa::StreamStatistics s;
  s.size = static_cast<std::uint32_t>(offsetof(vexa::StreamStatistics, bytesReceived));
  s.bytesReceived = 77;
  vexa::GetStreamStatistics(driver_, s);
  EXPECT_EQ(s.packetsReceived, 1u);
  EXPECT_EQ(s.bytesReceived, 77u);
  const auto table = vexa::AsTable(s);
  EXPECT_EQ(table.at("vexa_stream_packets_received_total"), 1u);
  EXPECT_EQ(table.count("vexa_stream_bytes_received_total"), 0u);
}

TEST_F(Statistics, ANewerHostsRecordIsFilledAsFarAsIsKnown) {
  struct Newer {
    vexa::StreamStatistics known;
    std::uint64_t later = 5;
  } newer;
  newer.known.size = sizeof newer;
  vexa::GetStreamStatistics(driver_, newer.known);
  EXPECT_EQ(newer.known.size, sizeof newer.known);
  EXPECT_EQ(newer.later, 5u);
}

TEST_F(Statistics, TheTableHasEachNumberOnce) {
  const auto table = vexa::AsTable(now());
  const std::size_t numbers = (sizeof(vexa::StreamStatistics) - offsetof(vexa::StreamStatistics, time)) / 8;
  EXPECT_EQ(table.size(), numbers + 1) << "and the transport";
  EXPECT_EQ(table.at("vexa_stream_packets_discarded_by_reason_total{reason=\"late\"}"), 0u);
}

TEST_F(Statistics, FactsComeWithTheFrame) {
  send_picture({kIdr});
  ASSERT_EQ(read(), LIBD_OK);
  const vexa::FrameFacts first = driver_.state().ready_frame.facts;
  EXPECT_EQ(first.rtpTime, 50000000u);
  EXPECT_EQ(first.firstSequence, 1u);
  EXPECT_EQ(first.keyPicture, 1u);
  EXPECT_EQ(first.discontinuity, vexa::FRAME_DISCONTINUITY_START);
  EXPECT_NE(first.valid & vexa::FRAME_FACTS_ARRIVAL, 0u);
  EXPECT_EQ(first.valid & vexa::FRAME_FACTS_SENDER_TIME, 0u);
  send_picture({kSlice, kSlice});
  ASSERT_EQ(read(), LIBD_OK);
  const vexa::FrameFacts next = driver_.state().ready_frame.facts;
  EXPECT_EQ(next.unwrappedRtpTime, 50003600);
  EXPECT_EQ(next.firstSequence, 2u);
  EXPECT_EQ(next.lastSequence, 3u);
  EXPECT_EQ(next.discontinuity, 0u);
  EXPECT_EQ(next.packetsLostBefore, 0u);
  EXPECT_GE(next.firstArrivalMonotonicTime, first.lastArrivalMonotonicTime);
}

TEST_F(Statistics, WithoutAFrameNoFactIsValidAndTheResultIsTheSlots) {
  SLibDVideoFrameInfo info;
  vexa::FrameFacts facts;
  facts.valid = 1;
  EXPECT_EQ(vexa::GetCurrentVideoFrame(driver_, info, facts), LIBD_NO_FRAME);
  EXPECT_EQ(facts.valid, 0u);
}

TEST_F(Statistics, FramesDroppedInTheQueueAreLostBeforeTheNextOneHandedOut) {
  send_picture({kIdr});
  ASSERT_EQ(read(), LIBD_OK);
  queue(LIBD_OK);
  for (int i = 0; i < 31; ++i) {
    send_picture({kSlice});
    ASSERT_EQ(read(), LIBD_OK);
    const vexa::QueuedFacts known = driver_.state().ready_frame;
    queue(LIBD_OK);
    EXPECT_EQ(driver_.state().ready_frame.data, nullptr);
    (void)known;
  }
  send_picture({kIdr});
  ASSERT_EQ(read(), LIBD_OK);
  queue(LIBD_OK);
  SLibDVideoFrameInfo info;
  vexa::FrameFacts facts;
  ASSERT_EQ(vexa::GetCurrentVideoFrame(driver_, info, facts), LIBD_OK);
  EXPECT_EQ(facts.framesLostBefore, 32u);
  EXPECT_EQ(facts.packetsLostBefore, 32u);
  EXPECT_EQ(facts.discontinuity, vexa::FRAME_DISCONTINUITY_START) << "of the first, which was never handed out";
}

}  // namespace
}  // namespace vexa_test

// The driver with its streaming members in reach, and a host that takes its frames.
#pragma once

#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/test_driver.h"

namespace vexa_test {

class MediaDriver : public TestDriver {
 public:
  /// Live video over RTP from the camera that `use` named.
  void use_live(const std::string& codec) {
    const vexa::Guard guard(m_ConnectionLock);
    m_ConnectionInfo.streamTransport = 1;
    m_CameraInfo.codecName = codec;
  }
  void use_live_h264() { use_live("H.264"); }

  using CVexaCommon::GetRtpCurrentVideoFrame;
  using CVexaCommon::GetRtpCurrentVideoFrameH264;
  using CVexaCommon::GetRtpCurrentVideoFrameJPEG;
  using CVexaCommon::GetRtpCurrentVideoFrameMPEG4;
  using CVexaCommon::GetUserDataFromStream;
  using CVexaCommon::m_CamPosLock;
  using CVexaCommon::m_CamPosText;
  using CVexaCommon::m_FirstPlaybackFrame;
  using CVexaCommon::m_FrameQueue;
  using CVexaCommon::m_FrameQueueLock;
  using CVexaCommon::m_LargeFrameBuffers;
  using CVexaCommon::m_LastFrameTime;
  using CVexaCommon::m_PlaybackBaseTimestamp;
  using CVexaCommon::m_RtpLiveMode;
  using CVexaCommon::m_RtpPacketBuffer;
  using CVexaCommon::m_RtpPackets;
  using CVexaCommon::m_StagingBuffer;
  using CVexaCommon::m_StagingBufferSize;
  using CVexaCommon::m_StopVideoEvent;
  using CVexaCommon::m_StopVideoRequested;
  using CVexaCommon::m_StreamingThread;
  using CVexaCommon::m_StreamWaitMs;
  using CVexaCommon::m_VideoStateLock;
  using CVexaCommon::m_VideoTimedOut;
  using CVexaCommon::ProcessCurrentFrameData;
  using CVexaCommon::PropulateFrameInfoList;
  using CVexaCommon::ReleaseRtpPacketsPtr;
  using CVexaCommon::rtp_over_tcp_open;
  using CVexaCommon::rtp_over_tcp_payload_recv;
  using CVexaCommon::rtp_over_udp_payload_recv;
  using CVexaCommon::rtp_over_udp_payload_recv_h264;
  using CVexaCommon::rtp_over_udp_recvn;
  using CVexaCommon::RTPJpegToJIF;
  using CVexaCommon::StreamingThread;
};

/// A frame as the host got it.
struct TakenFrame {
  std::string bytes;
  SLibDVideoFrameInfo info;
};

class FrameTaker : public CDataSink {
 public:
  void Write(const unsigned char* data, unsigned int length) override {
    bytes_.assign(reinterpret_cast<const char*>(data), length);
  }

  /// One poll; the frame when there is one.
  ELibDReturnCode take(CLibraryDevice& driver, TakenFrame& frame) {
    frame.info.sink = this;
    const ELibDReturnCode code = driver.GetCurrentVideoFrame(frame.info);
    if (code == LIBD_OK) frame.bytes = std::move(bytes_);
    return code;
  }

  /// Polls until `count` frames have come, or none has for `patience`.
  std::vector<TakenFrame> take_all(CLibraryDevice& driver, std::size_t count,
                                   std::chrono::milliseconds patience = std::chrono::seconds(10)) {
    std::vector<TakenFrame> frames;
    auto last = std::chrono::steady_clock::now();
    while (frames.size() < count && std::chrono::steady_clock::now() - last < patience) {
      TakenFrame frame;
      if (take(driver, frame) == LIBD_OK) {
        frames.push_back(std::move(frame));
        last = std::chrono::steady_clock::now();
      } else {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
      }
    }
    return frames;
  }

 private:
  std::string bytes_;
};

}  // namespace vexa_test

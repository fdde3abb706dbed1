// The driver with its stream readers in reach.
#pragma once

#include <vector>

#include "tests/support/test_driver.h"

namespace vexa_test {

class StreamDriver : public TestDriver {
 public:
  ~StreamDriver() override { hold_stream(0); }

  /// A stream buffer of `size` bytes, with nothing received yet; 0: none.
  void hold_stream(std::size_t size) {
    delete[] m_StreamBuffer;
    m_StreamBuffer = size == 0 ? nullptr : new unsigned char[size];
    m_StreamBufferSize = size;
    m_StreamFrameStart = m_StreamSearchPos = m_StreamWriteEnd = m_StreamBuffer;
  }

  using CVexaCommon::http_multipart_input_recv;
  using CVexaCommon::http_multipart_jpeg_recv;
  using CVexaCommon::http_multipart_mddata_recv;
  using CVexaCommon::http_stream_recv;
  using CVexaCommon::m_CamPosLock;
  using CVexaCommon::m_CamPosText;
  using CVexaCommon::m_IoBoxInfo;
  using CVexaCommon::m_StopVideoEvent;
  using CVexaCommon::m_StreamBuffer;
  using CVexaCommon::m_StreamFrameStart;
  using CVexaCommon::m_StreamSearchPos;
  using CVexaCommon::m_StreamWriteEnd;
  using CVexaCommon::m_UseMotionDetection;
  using CVexaCommon::rtp_over_tcp_open;
  using CVexaCommon::rtp_over_tcp_payload_recv;
  using CVexaCommon::rtp_over_tcp_recvn;
};

}  // namespace vexa_test

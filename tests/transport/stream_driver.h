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
};

}  // namespace vexa_test

// SPDX-License-Identifier: Apache-2.0
// The driver with everything in reach that model classes reach, and a camera address set without a log file.
#pragma once

#include <string>
#include <vector>

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "tests/support/driver_reach.h"
#include "transport/failure.h"
#include "vexa/vexa_common.h"

namespace vexa_test {

class TestDriver : public Reach<CVexaCommon> {
 public:
  TestDriver() = default;

  /// Speaks to a camera that listens for HTTP and RTSP on one port, as "admin" with the password "secret".
  void use(const std::string& host, int port, int timeout) {
    const vexa::Guard guard(m_ConnectionLock);
    m_ConnectionInfo.host = host;
    m_ConnectionInfo.port = port;
    m_ConnectionInfo.timeout = timeout;
    m_ConnectionInfo.userName = "admin";
    m_ConnectionInfo.password = "secret";
    m_SavedTimeout = timeout;
    m_CameraInfo.rtspPort = port;
  }

  /// The latest error as tests compare it: "CODE TEXT".
  std::string latest_error() { return std::to_string(LatestErrorCode()) + " " + LatestErrorText(); }
  ELibDReturnCode LatestErrorCode() { return m_State->errors.code(); }
  std::string LatestErrorText() { return m_State->errors.text(); }
  void Fail(const vexa::Failure& failure) { m_State->errors.record(failure); }
  void ClearLatestError() { m_State->errors.clear(); }

  /// The latest error as it stands from a failure long before, so that a test sees what a call sets.
  void soil_latest_error() { Fail({LIBD_INVALID_MODE, "from before"}); }

  vexa::DriverState& state() { return *m_State; }
  vexa::CameraLink& camera() { return m_State->camera; }
  int ConnectionTimeout() { return m_State->connection.timeout(); }
  /// The camera's position, as it was last stored.
  std::string position_text() {
    const vexa::Guard guard(m_CamPosLock);
    return m_CamPosText;
  }
  /// A media socket as an open makes it: its port.
  int bind_media_socket() {
    m_State->set_stream_socket(vexa::make_media_socket().release());
    const auto port = vexa::bind_media_socket(m_StreamSocket);
    return port ? *port : -1;
  }
};

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

// The driver with everything in reach that model classes reach, and a camera address set without a log file.
#pragma once

#include <string>

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "transport/failure.h"
#include "vexa/vexa_common.h"

namespace vexa_test {

class TestDriver : public CVexaCommon {
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
  /// A media socket as an open makes it: its port.
  int bind_media_socket() {
    m_State->set_stream_socket(vexa::make_media_socket().release());
    const auto port = vexa::bind_media_socket(m_StreamSocket);
    return port ? *port : -1;
  }

  using CVexaCommon::_ld_is_leap_year;
  using CVexaCommon::_ld_mkgmtime;
  using CVexaCommon::AddUrlEncoding;
  using CVexaCommon::base64Decode;
  using CVexaCommon::base64Encode;
  using CVexaCommon::find_start_code_h264;
  using CVexaCommon::find_start_code_mpeg4;
  using CVexaCommon::GetCommonNetworkInfo;
  using CVexaCommon::GetCommonSystemInfo;
  using CVexaCommon::GetUrlParameter;
  using CVexaCommon::http_close;
  using CVexaCommon::http_header_recv;
  using CVexaCommon::http_open;
  using CVexaCommon::http_recv;
  using CVexaCommon::http_recvn;
  using CVexaCommon::InitEdgeStorageKeepAlivePeriod;
  using CVexaCommon::KeepAlive;
  using CVexaCommon::parse_clock;
  using CVexaCommon::rtp_over_tcp_close;
  using CVexaCommon::rtp_over_tcp_header_recv;
  using CVexaCommon::rtp_over_udp_close;
  using CVexaCommon::rtp_over_udp_open;
  using CVexaCommon::rtp_stream_socket_close_all;
  using CVexaCommon::SendInqCommand;

  using CVexaCommon::m_AudioLock;
  using CVexaCommon::m_AudioSocket;
  using CVexaCommon::m_BasicCredentials;
  using CVexaCommon::m_CameraInfo;
  using CVexaCommon::m_CameraType;
  using CVexaCommon::m_CGILogEnabled;
  using CVexaCommon::m_CGILogger;
  using CVexaCommon::m_CGILogPath;
  using CVexaCommon::m_ChannelId;
  using CVexaCommon::m_ConnectionInfo;
  using CVexaCommon::m_ConnectionLock;
  using CVexaCommon::m_ContinuousPTZ;
  using CVexaCommon::m_EdgeStoragePlayback;
  using CVexaCommon::m_EdgeStorageSupported;
  using CVexaCommon::m_FixedCameraInfo;
  using CVexaCommon::m_FixedConnectionInfo;
  using CVexaCommon::m_FixedSystemInfo;
  using CVexaCommon::m_InquirySizes;
  using CVexaCommon::m_IoStreamLock;
  using CVexaCommon::m_IoStreamSocket;
  using CVexaCommon::m_KeepAlivePeriod;
  using CVexaCommon::m_LastKeepAliveTime;
  using CVexaCommon::m_LatestErrorCode;
  using CVexaCommon::m_NoTearDown;
  using CVexaCommon::m_PendingPins;
  using CVexaCommon::m_PlaybackScale;
  using CVexaCommon::m_RangeClockMicros;
  using CVexaCommon::m_RangeClockSeconds;
  using CVexaCommon::m_RtpClockRate;
  using CVexaCommon::m_RtspCSeq;
  using CVexaCommon::m_RtspSession;
  using CVexaCommon::m_RtspSocket;
  using CVexaCommon::m_RtspUrl;
  using CVexaCommon::m_SavedTimeout;
  using CVexaCommon::m_StreamSocket;
};

}  // namespace vexa_test

// SPDX-License-Identifier: Apache-2.0
// How a camera is reached, and what it reports about itself.
#pragma once

#include <cstdint>
#include <string>

/// Where a camera is, and how the driver connects to it.
struct SLibDConnectionInfo {
  std::int32_t streamTransport = 0;  ///< 1: video by RTSP/RTP; any other value: the HTTP image stream
  std::string host;                  ///< host name or dotted address
  std::int32_t port = 0;             ///< the camera's HTTP port
  bool reserved4 = false;            ///< stored and returned, no more
  bool useProxy = false;             ///< HTTP connections go to the proxy; RTSP and RTP do not
  std::string proxyHost;             ///< host name or dotted address
  std::int32_t proxyPort = 0;
  std::int32_t timeout = 0;  ///< milliseconds, of every connect and read; 0 or less: no wait
  std::string userName;      ///< HTTP Basic user
  std::string password;      ///< HTTP Basic password; handed back as stored
};

/// What a camera reports about itself.
struct SLibDSystemInfo {
  std::string maker;
  std::string modelName;
  std::string softwareVersion;
  std::string serialNumber;
  std::string macAddress;
};

/// What a model class states about its camera. The driver itself reads modelName, capability3 and capability4.
struct SLibDFixedSystemInfo {
  std::string modelName = "Unknown";
  std::string reserved2 = "Unknown";
  std::string reserved3 = "Unknown";
  std::string version = "1.0.0.0";
  std::string maker = "Vexa Corporation";
  std::int32_t capability1 = -1;
  std::int32_t capability2 = 0;
  std::int32_t capability3 = 0;  ///< audio: the camera has none when capability3 and capability4 are 0
  std::int32_t capability4 = 0;
  std::int32_t capability5 = 0;
  std::int32_t capability6 = 0;
  bool flag1 = false;
  bool flag2 = false;
  bool flag3 = false;
  bool flag4 = false;
};

/// Fixed description of the connection; the driver copies it to the host and reads none of it.
struct SLibDFixedConnectionInfo {
  bool flag1 = true;
  bool flag2 = false;
  bool flag3 = false;
  bool flag4 = false;
  std::string text = "0-0";
};

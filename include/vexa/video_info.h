// SPDX-License-Identifier: Apache-2.0
// Video settings, video capabilities and video frames.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "vexa/common_types.h"
#include "vexa/export.h"

enum ELibDVideoStandard : std::int32_t { LIBD_VIDEO_PAL = 0, LIBD_VIDEO_NTSC = 1 };

/// Where a camera sends its picture: to the network only, or to an analog output as well.
enum ELibVideoOutMode : std::int32_t { LIB_VIDEO_OUT_IP = 0, LIB_VIDEO_OUT_PAL = 1, LIB_VIDEO_OUT_NTSC = 2 };

/// A set of camera-type bits; model classes and hosts agree on their meaning.
enum ELibCameraType : std::uint32_t {};

/// What a frame holds (SLibDVideoFrameInfo::frameType).
enum ELibDVideoFrameType : std::int32_t {
  VIDEO_FRAME_INVALID = -1,      ///< not a picture, or not one yet; no frame of this type reaches a host
  VIDEO_FRAME_JPEG = 0,          ///< a JPEG picture
  VIDEO_FRAME_MPEG4_KEY = 10,    ///< an MPEG-4 picture led by a visual-object-sequence (or group) header
  VIDEO_FRAME_MPEG4_DELTA = 11,  ///< another MPEG-4 picture
  VIDEO_FRAME_H264_KEY = 20,     ///< an H.264 picture with a sequence parameter set or an IDR slice
  VIDEO_FRAME_H264_DELTA = 22    ///< another H.264 picture
};

/// Settings of one video stream of the camera. Every text has room for 256 characters from the start.
struct VEXA_API SLibDCameraInfo {
  SLibDCameraInfo();

  std::int32_t codecType = 1;          ///< 0 JPEG, 1 MPEG-4, 2 H.264
  std::string codecName;               ///< "JPEG", "MPEG4" or "H.264"
  std::int32_t streamNumber = 1;       ///< the camera's video stream, from 1: the number at the end of its keys
  std::string imageSizeText = "none";  ///< for instance "640x480"
  std::int32_t imageWidth = 0;         ///< pixels
  std::int32_t imageHeight = 0;        ///< pixels
  std::int32_t reserved7 = 0;          ///< the host's
  std::string frameRateText = "none";  ///< for instance "30fps"
  std::int32_t frameRate = 0;          ///< frames per second
  std::string qualityText = "none";    ///< for instance "Level 5"
  std::int32_t quality = 0;            ///< JPEG quality level
  std::string bitRateText = "none";    ///< for instance "2000kbit/s"
  std::int32_t bitRate = 0;            ///< kbit/s (MPEG-4 and H.264)
  std::string reserved14 = "none";     ///< the host's
  std::int32_t reserved15 = 0;         ///< the host's
  bool reserved16 = false;             ///< the host's
  std::int32_t rotation = 0;           ///< degrees; 180 turns the electronic flip on
  std::int32_t videoStandard = LIBD_VIDEO_PAL;  ///< an ELibDVideoStandard value
  std::int32_t reserved19 = 7;                  ///< the host's
  std::int32_t captureWidth = 0;                ///< pixels
  std::int32_t captureHeight = 0;               ///< pixels
  std::int32_t unicastVideoPort = 0;
  std::int32_t unicastVideoPort1 = 0;
  std::int32_t unicastVideoPort2 = 0;
  std::int32_t rtspPort = 0;
  bool solidPtz = false;            ///< solid-PTZ state
  std::int32_t maxImageWidth = 0;   ///< pixels
  std::int32_t maxImageHeight = 0;  ///< pixels
};

/// What the camera's video can do; filled by a model class and by the resolution filter.
struct SLibDFixedCameraInfo {
  std::vector<SLibDVideoCodecInfo> codecs;  ///< offered codecs with their sizes
  std::vector<std::string> reserved2;
  std::int32_t electronicFlip = 0;  ///< not 0: the camera takes the electronic-flip setting
  std::vector<std::int32_t> reserved4;
  std::int32_t streamCount1 = 0;  ///< numbers of video streams; both below 2: a single-stream camera
  std::int32_t streamCount2 = 0;
  bool flag1 = false;
  bool flag2 = false;
  bool flag3 = false;
  bool flag4 = false;
  bool flag5 = false;
  bool flag6 = false;
  std::int32_t value1 = 0;
  std::int32_t value2 = 0;
  std::int32_t value3 = 0;
  std::int32_t value4 = 0;
  std::int32_t value5 = 0;
};

/// The host's record of GetCurrentVideoFrame: `sink` is in, the rest is out.
struct SLibDVideoFrameInfo {
  CDataSink* sink = nullptr;  ///< the host's; receives the frame's bytes during the call. Null: the bytes are dropped
  std::int32_t frameType = VIDEO_FRAME_INVALID;  ///< an ELibDVideoFrameType value
  std::int32_t seconds = 0;       ///< time stamp, whole seconds since 1970-01-01 UTC; 0 for live RTP and JPEG over HTTP
  std::int32_t microseconds = 0;  ///< time stamp, fraction
};

/// One received RTP packet (RFC 3550) as the driver keeps it for ordering. Numbers are in host order.
struct SPacketInfo {
  unsigned char* data = nullptr;  ///< the whole datagram in the driver's packet buffer, RTP header first
  bool received = false;          ///< set by every successful read
  bool marker = false;            ///< last packet of a picture
  unsigned char payloadType = 0;  ///< 0 to 127
  std::uint16_t sequence = 0;
  std::uint32_t length = 0;     ///< bytes, the 12-byte RTP header included
  std::uint32_t timestamp = 0;  ///< in units of the RTP clock
  bool keyOnly = false;         ///< a search key: compare by timestamp alone, after all packets of that timestamp
};

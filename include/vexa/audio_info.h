// SPDX-License-Identifier: Apache-2.0
// Audio settings, capabilities and frames.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "vexa/common_types.h"

/// Settings of the camera's audio input.
struct SLibDAudioInfo {
  std::int32_t reserved1 = 0;
  std::string codec = "none";  ///< "G711" or "G726"
  std::string reserved3 = "none";
  std::string bitRateLabel = "none";       ///< for instance "64 Kbps"
  std::int32_t bitRate = 0;                ///< bit/s
  std::string frameSizeLabel = "none";     ///< for instance "1280 bytes"
  std::int32_t frameSize = 0;              ///< bytes: 160 ms of audio
  std::string samplingRateLabel = "none";  ///< "8 kHz"
  std::int32_t samplingRate = 0;           ///< Hz
  std::int32_t reserved10 = 0;
  std::string label1 = "none";
  std::int32_t value1 = 0;
  std::string label2 = "none";
  std::int32_t value2 = 0;
  std::string label3 = "none";
  std::int32_t value3 = 0;
  std::string label4 = "none";
  std::int32_t value4 = 0;
  std::string label5 = "none";
  std::int32_t value5 = 0;
  std::int32_t reserved21 = 0;
};

/// The host's record of GetCurrentAudioFrame: `data` and `capacity` are in, the rest is out.
struct SLibDAudioFrameInfo {
  unsigned char* data = nullptr;  ///< the host's buffer
  std::int32_t capacity = 0;      ///< bytes at `data`
  std::int32_t length = 0;        ///< bytes delivered
  std::int32_t codecType = 0;     ///< 10 G.711, 20 G.726, -1 other
};

/// What the camera's audio can do; filled by a model class.
struct SLibDFixedAudioInfo {
  std::vector<SLibDAudioCodecInfo> inputCodecs;
  std::vector<SLibDAudioCodecInfo> outputCodecs;
  std::vector<SLibDCommonParameterInt> reserved3;
  std::vector<SLibDCommonParameterInt> reserved4;
  std::int32_t available = 0;  ///< 1 when the camera has audio
};

// SPDX-License-Identifier: Apache-2.0
// Small records that several families share, and the host's frame receiver.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

/// A label and its number: one item of a capability list ("64 Kbps", 64000).
struct SLibDCommonParameterInt {
  SLibDCommonParameterInt() = default;
  SLibDCommonParameterInt(std::string itemLabel, std::int32_t itemValue)
      : label(std::move(itemLabel)), value(itemValue) {}

  std::string label;       ///< as shown to an operator
  std::int32_t value = 0;  ///< as sent to the camera, in the unit of the list
};

/// One point of a camera's zoom curve; between two points the magnification grows evenly.
struct SLibDZoomRatioInt {
  std::int32_t ratio = 0;     ///< magnification against the wide end: 18 is 18 times; 0: not known
  std::int32_t position = 0;  ///< zoom position, in steps of the camera's lens
};

/// One day/night mode that a camera offers.
struct SLibDDayNightModeInfo {
  std::int32_t mode = 0;  ///< an ELibDDayNightType value
};

/// One exposure mode and the steps it offers, each list ascending by value.
struct SLibDBrightModeInfo {
  std::string name;                                    ///< "Full auto", "Shutter Priority", "Iris Priority"
  std::vector<SLibDCommonParameterInt> shutterSpeeds;  ///< shutter steps, in the camera's numbers
  std::vector<SLibDCommonParameterInt> irisPositions;  ///< iris steps, in the camera's numbers
  std::vector<SLibDCommonParameterInt> reserved4;      ///< copied through
};

/// One audio codec and what it offers.
struct SLibDAudioCodecInfo {
  std::string name;                                    ///< "G711" or "G726"
  std::vector<SLibDCommonParameterInt> bitRates;       ///< bit/s
  std::vector<SLibDCommonParameterInt> frameSizes;     ///< bytes
  std::vector<SLibDCommonParameterInt> samplingRates;  ///< Hz
};

/// A picture size.
struct SLibDResolutionInfo {
  std::string text;         ///< for instance "640x480"
  std::int32_t width = 0;   ///< pixels
  std::int32_t height = 0;  ///< pixels
};

/// One video codec and what it offers.
struct SLibDVideoCodecInfo {
  std::string name;                                 ///< "JPEG", "MPEG4" or "H.264"
  std::vector<SLibDResolutionInfo> resolutions;     ///< picture sizes
  std::vector<SLibDCommonParameterInt> frameRates;  ///< frames per second
  std::vector<SLibDCommonParameterInt> qualities;   ///< JPEG quality levels
  std::vector<SLibDCommonParameterInt> bitRates;    ///< kbit/s
};

/// A point; its unit is the owner's.
struct SLibDCommonPosition {
  std::int32_t x = 0;
  std::int32_t y = 0;
};

/// The host's receiver of frames. The driver calls Write from the thread that polls, with the frame queue locked and
/// the frame still in it: copy and return. Write must not call the driver, nor wait for a thread that does: polled from
/// here, the driver would hand out and free the same frame, and a stop would wait for ever for the streaming thread,
/// which waits for the queue. An exception thrown here passes to the poller, and the frame stays queued.
class CDataSink {
 public:
  /// Takes `length` bytes at `data`, which are the driver's and end with the call.
  virtual void Write(const unsigned char* data, unsigned int length) = 0;

 protected:
  // Not virtual: hosts built elsewhere count on Write being the first slot.
  ~CDataSink() = default;
};

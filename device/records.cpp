// SPDX-License-Identifier: Apache-2.0
// The out-of-line members of the public records.
#include "vexa/io_info.h"
#include "vexa/video_info.h"

namespace {

constexpr std::size_t kTextRoom = 256;
constexpr std::size_t kAreaRoom = 32;

}  // namespace

SLibDCameraInfo::SLibDCameraInfo() {
  for (std::string* text : {&codecName, &imageSizeText, &frameRateText, &qualityText, &bitRateText, &reserved14}) {
    text->reserve(kTextRoom);
  }
}

SLibDDetectionWindow::SLibDDetectionWindow() { area.reserve(kAreaRoom); }

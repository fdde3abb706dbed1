// SPDX-License-Identifier: Apache-2.0
// The operations that ask a camera, one after the other, with whatever it answers. The first byte of the input is the
// first operation's number; bit 7 of it makes each record the body of a good answer, else records are whole answers.
#include <string>
#include <vector>

#include "fuzz/in_process_camera.h"
#include "tests/support/test_driver.h"

namespace {

using Driver = vexa_test::TestDriver;

constexpr int kTimeout = 20;  // milliseconds; an answer is there at once, or its end

template <typename Value, ELibDReturnCode (CLibraryDevice::*kGet)(Value&)>
void ask(Driver& driver) {
  Value value{};
  (driver.*kGet)(value);
}

void ask_detection(Driver& driver) {
  std::vector<SLibDDetectionParam> params;
  ELibDPositionMode mode{};
  driver.GetObjectDetectionSetting(params, mode);
}

void ask_illuminator(Driver& driver) {
  ELibIRIlluminatorMode mode{};
  int strength = 0;
  driver.GetIRIlluminator(mode, strength);
}

void ask_any(Driver& driver) {
  std::string answer;
  driver.SendInqCommand("system", answer);
}

constexpr void (*kOperations[])(Driver&) = {
    ask<SLibDSystemInfo, &CLibraryDevice::GetCurrentSystemInfo>,
    ask<SLibDCameraInfo, &CLibraryDevice::GetCameraInfo>,
    ask<ELibDDayNightType, &CLibraryDevice::GetDayNightMode>,
    ask<ELibDVisibilityEnhancerType, &CLibraryDevice::GetVisibilityEnhancerMode>,
    ask<ELibDXdnrType, &CLibraryDevice::GetXdnrMode>,
    ask<ELibDViewDRMode, &CLibraryDevice::GetViewDR>,
    ask<SLibDPTZStatus, &CLibraryDevice::GetCurrentPosition>,
    ask<SLibDPTZControlInfo, &CLibraryDevice::GetPTZControlInfo>,
    ask<std::vector<SLibDPresetInfo>, &CLibraryDevice::GetPresets>,
    ask<SLibDCameraTourInfo, &CLibraryDevice::GetCameraTourInfo>,
    ask<SLibDShadowTourInfo, &CLibraryDevice::GetShadowTourInfo>,
    ask<SLibDAudioInfo, &CLibraryDevice::GetAudioInfo>,
    ask<SLibDIoBoxInfo, &CLibraryDevice::GetIoBoxInfo>,
    ask<SLibDEdgeStorageMode, &CLibraryDevice::GetEdgeStorageMode>,
    ask<SLibDEdgeStorageRecordList, &CLibraryDevice::GetEdgeStorageRecordList>,
    ask_detection,
    ask_illuminator,
    ask_any,
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  vexa_fuzz::Records records({data + 1, size - 1});
  vexa_fuzz::InProcessCamera camera(records);
  if ((data[0] & 0x80) != 0) camera.begin_answers_with("HTTP/1.0 200 OK\r\n\r\n");
  Driver driver;
  driver.use("127.0.0.1", 80, kTimeout);
  driver.m_EdgeStorageSupported = driver.m_LodDetection = true;
  driver.m_FixedIoBoxInfo.tamperingDetection = driver.m_FixedIoBoxInfo.audioDetection = true;
  driver.m_FixedCameraInfoAvailable = driver.m_FixedPTZControlInfoAvailable = driver.m_FixedIoBoxInfoAvailable = true;
  for (std::size_t operation = data[0] & 0x7f; !records.is_empty(); ++operation) {
    kOperations[operation % std::size(kOperations)](driver);
    std::string text;
    driver.GetLatestErrorText(text);
    vexa_fuzz::check(text.find("c2VjcmV0") == std::string::npos);
  }
  return 0;
}

// SPDX-License-Identifier: Apache-2.0
// The streams that a host polls: alarms, motion metadata and sound. The first byte of the input chooses one; each
// record comes at a time of its own.
#include <vector>

#include "fuzz/in_process_camera.h"
#include "fuzz/stream_pair.h"
#include "runtime/base/sync.h"
#include "tests/support/test_driver.h"

namespace {

// Inputs and detectors, of which a camera can have up to 32.
void poll_alarms(vexa_test::TestDriver& driver) {
  std::vector<SLibDPinInfo> pins;
  if (driver.GetCurrentIoStatus(pins) != LIBD_OK) return;
  vexa_fuzz::check(!pins.empty() && pins.size() <= 32);
  for (const SLibDPinInfo& pin : pins) vexa_fuzz::check(pin.state == 0 || pin.state == 1);
}

void poll_metadata(vexa_test::TestDriver& driver) {
  SLibDRawMDFrameInfo frame;
  driver.CLibraryDevice::GetCurrentPosition(frame);
}

void poll_sound(vexa_test::TestDriver& driver) {
  unsigned char room[320];
  SLibDAudioFrameInfo frame;
  frame.data = room;
  frame.capacity = sizeof room;
  if (driver.GetCurrentAudioFrame(frame) != LIBD_OK) return;
  vexa_fuzz::check(frame.length > 0 && frame.length <= frame.capacity);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  vexa_fuzz::Records records({data + 1, size - 1});
  vexa_fuzz::StreamPair ends;
  if (!ends.valid()) return 0;
  vexa_test::TestDriver driver;
  driver.use("127.0.0.1", 80, 20);
  const int stream = data[0] % 3;
  driver.m_FixedIoBoxInfo.videoDetection = driver.m_FixedIoBoxInfo.tamperingDetection = true;
  driver.m_FixedIoBoxInfo.audioDetection = (data[0] & 4) != 0;
  driver.m_UseMotionDetection = (data[0] & 8) != 0;
  int& socket = stream == 0 ? driver.m_IoStreamSocket : stream == 1 ? driver.m_MdStreamSocket : driver.m_AudioSocket;
  socket = ends.of_driver();
  while (const auto record = records.next()) {
    if (record->empty()) continue;
    ends.send(*record);
    if (stream == 0) poll_alarms(driver);
    if (stream == 1) poll_metadata(driver);
    if (stream == 2) poll_sound(driver);
  }
  ends.end();
  driver.StopIoStreaming();
  driver.StopModRawData();
  driver.StopAudioStreaming();
  return 0;
}

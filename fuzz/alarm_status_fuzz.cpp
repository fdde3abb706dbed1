// SPDX-License-Identifier: Apache-2.0
// The alarm stream of any bytes, polled by the driver; the first byte decides what the camera has. Also the answers
// about its pins.
#include <fcntl.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <string_view>
#include <vector>

#include "device/cgi/alarm_text.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

/// Polls what one end of a socket pair holds.
class PolledDriver : public CVexaCommon {
 public:
  PolledDriver(std::string_view stream, unsigned camera) {
    int ends[2];
    check(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) == 0);
    check(fcntl(ends[0], F_SETFL, O_NONBLOCK) == 0);
    check(send(ends[1], stream.data(), stream.size(), MSG_NOSIGNAL) == static_cast<ssize_t>(stream.size()));
    close(ends[1]);
    {
      const vexa::Guard guard(m_IoStreamLock);
      m_IoStreamSocket = ends[0];
    }
    m_ConnectionInfo.timeout = 1;
    m_UseMotionDetection = (camera & 1) != 0;
    SetVMDtype((camera & 2) != 0 ? LIBD_VMD_VMF : LIBD_VMD_WINDOW);
    m_FixedIoBoxInfo.videoDetection = (camera & 4) != 0;
    m_FixedIoBoxInfo.tamperingDetection = (camera & 8) != 0;
    m_FixedIoBoxInfo.audioDetection = (camera & 16) != 0;
    m_FixedIoBoxInfo.inputCount = static_cast<std::int32_t>(camera >> 5);
  }
  ~PolledDriver() override {
    const vexa::Guard guard(m_IoStreamLock);
    close(m_IoStreamSocket);
    m_IoStreamSocket = -1;
  }

  ELibDReturnCode poll(std::vector<SLibDPinInfo>& pins) { return GetCurrentIoStatusDetail(pins); }
};

void check_pins(const std::vector<SLibDPinInfo>& pins) {
  int number = 0;
  for (const SLibDPinInfo& pin : pins) {
    check(pin.number > number && pin.number <= 32);
    number = pin.number;
    check(pin.type >= 0 && pin.type <= 5 && pin.type != 1 && pin.type != 3);
    check(pin.enabled && (pin.state == 0 || pin.state == 1));
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr std::size_t kMost = 8192;
  if (size == 0 || size > kMost) return 0;
  const std::string_view stream(reinterpret_cast<const char*>(data) + 1, size - 1);
  PolledDriver driver(stream, data[0]);
  std::vector<SLibDPinInfo> pins;
  // Each part has two bytes at least, and only a part gives pins.
  std::size_t parts = 0;
  while (driver.poll(pins) == LIBD_OK) {
    check_pins(pins);
    check(++parts <= size);
  }
  check(vexa::sensor_pins(stream).size() <= size / 9);
  const auto level = vexa::tamper_level_of(stream);
  check(!level || (*level >= 0 && *level <= 3));
  vexa::detector_enabled(stream, "ADFunc=");
  return 0;
}

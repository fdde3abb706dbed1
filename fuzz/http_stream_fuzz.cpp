// SPDX-License-Identifier: Apache-2.0
// A long-lived HTTP video stream: parts of a multipart answer with a JPEG picture each, or an elementary stream of
// H.264 or MPEG-4. The first byte of the input chooses the codec; each record comes at a time of its own.
#include <iterator>
#include <vector>

#include "fuzz/no_waiting.h"
#include "fuzz/records.h"
#include "fuzz/stream_pair.h"
#include "runtime/base/sync.h"
#include "tests/support/test_driver.h"

namespace {

constexpr const char* kCodecs[] = {"JPEG", "H.264", "MPEG4"};

void read_all(vexa_test::TestDriver& driver) {
  static std::vector<unsigned char> room(50000);
  CVexaCommon::VideoFrameInfo frame;
  frame.data = room.data();
  frame.capacity = static_cast<unsigned int>(room.size());
  for (int reads = 0; reads < 100; ++reads) {
    frame.length = 0;
    if (driver.GetCurrentFrameData(frame) != LIBD_OK) return;
    vexa_fuzz::check(frame.length <= frame.capacity);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  vexa_fuzz::Records records({data + 1, size - 1});
  vexa_fuzz::StreamPair ends;
  if (!ends.valid()) return 0;
  vexa_test::TestDriver driver;
  driver.use("127.0.0.1", 80, 20);
  {
    const vexa::Guard guard(driver.m_ConnectionLock);
    driver.m_CameraInfo.codecName = kCodecs[data[0] % std::size(kCodecs)];
  }
  driver.state().set_stream_socket(ends.of_driver());
  driver.state().reset_stream_buffer();
  while (const auto record = records.next()) {
    ends.send(*record);
    read_all(driver);
  }
  ends.end();
  read_all(driver);
  driver.state().release_stream_buffer();
  driver.state().close_media();
  return 0;
}

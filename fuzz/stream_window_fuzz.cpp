// SPDX-License-Identifier: Apache-2.0
// An elementary stream in pieces: a byte of length before each. However they come, no byte of the stream is lost.
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "media/assembly/elementary_unit.h"
#include "media/assembly/start_code.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace {

constexpr std::size_t kBuffer = 65536 + 300;  // small enough to be moved often

void run(const vexa::ElementaryCodec& codec, vexa::Bytes input) {
  std::vector<unsigned char> buffer(kBuffer);
  unsigned char* start = buffer.data();
  unsigned char* search = start;
  unsigned char* end = start;
  vexa::StreamWindow window(buffer, {start, search, end});
  std::vector<unsigned char> frame(kBuffer);
  std::vector<unsigned char> fed;
  std::vector<unsigned char> cut;
  vexa::ByteReader in(input);
  while (in.ok()) {
    const vexa::Bytes piece = in.take(in.u8());
    window.make_room(codec.start_code);
    const auto room = window.free_room();
    const std::size_t count = std::min(room.size(), piece.size());
    std::copy_n(piece.begin(), count, room.begin());
    fed.insert(fed.end(), room.begin(), room.begin() + static_cast<std::ptrdiff_t>(count));
    window.received(count);
    std::size_t length = 0;
    while (window.cut_frame(codec.start_code, frame, length) == vexa::StreamWindow::Cut::kFrame) {
      codec.text_of({frame.data(), length});
      codec.kind_of({frame.data(), length});
      cut.insert(cut.end(), frame.begin(), frame.begin() + static_cast<std::ptrdiff_t>(length));
    }
  }
  cut.insert(cut.end(), start, end);
  if (cut != fed) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  run(vexa::kH264Elementary, {data, size});
  run(vexa::kMpeg4Elementary, {data, size});
  return 0;
}

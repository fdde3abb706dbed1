#include "media/assembly/picture_format.h"

#include <algorithm>

#include "media/assembly/start_code.h"

namespace vexa {
namespace {

/// Where a frame opens with its parameters, they end within this.
constexpr std::size_t kFront = 1024;

constexpr std::uint8_t kSequenceParameterSet = 7;
constexpr std::uint8_t kFirstVideoObjectLayer = 0x20;
constexpr std::uint8_t kLastVideoObjectLayer = 0x2f;

constexpr std::uint8_t kMarker = 0xff;
constexpr std::uint8_t kStartOfImage = 0xd8;
constexpr std::uint8_t kStartOfFrame = 0xc0;
constexpr std::uint8_t kStartOfScan = 0xda;

/// FNV-1a; never 0.
std::uint64_t hash_of(Bytes bytes) {
  std::uint64_t hash = 0xcbf29ce484222325;
  for (const unsigned char byte : bytes) hash = (hash ^ byte) * 0x100000001b3;
  return hash == 0 ? 1 : hash;
}

/// The bytes after the first start code whose unit `is_wanted`, up to the next start code.
template <typename IsWanted>
Bytes unit_of(Bytes frame, IsWanted is_wanted) {
  const Bytes front = frame.first(std::min(frame.size(), kFront));
  const auto* end = front.data() + front.size();
  const auto next_code = [end](const unsigned char* from) {
    return find_start_code_mpeg4(from, static_cast<unsigned int>(end - from));
  };
  constexpr std::size_t kCode = 3;
  for (const unsigned char* code = next_code(front.data()); code != nullptr;) {
    const unsigned char* unit = code + kCode;
    code = next_code(unit);
    if (unit < end && is_wanted(*unit)) return {unit, code == nullptr ? end : code};
  }
  return {};
}

std::uint64_t jpeg_format(Bytes frame) {
  ByteReader in(frame.first(std::min(frame.size(), kFront)));
  if (in.u8() != kMarker || in.u8() != kStartOfImage) return 0;
  while (in.ok() && in.u8() == kMarker) {
    const std::uint8_t kind = in.u8();
    const std::uint16_t length = in.u16();
    if (kind == kStartOfScan || length < 2) return 0;
    if (kind != kStartOfFrame) {
      in.take(length - 2U);
      continue;
    }
    in.u8();  // bits a sample
    const std::uint64_t height = in.u16();
    const std::uint64_t width = in.u16();
    return in.ok() ? width << 16 | height : 0;
  }
  return 0;
}

}  // namespace

std::uint64_t picture_format(CodecKind codec, Bytes frame) {
  switch (codec) {
    case CodecKind::kJpeg:
      return jpeg_format(frame);
    case CodecKind::kMpeg4: {
      const Bytes layer = unit_of(
          frame, [](std::uint8_t code) { return code >= kFirstVideoObjectLayer && code <= kLastVideoObjectLayer; });
      return layer.empty() ? 0 : hash_of(layer);
    }
    case CodecKind::kH264: {
      const Bytes set = unit_of(frame, [](std::uint8_t header) { return (header & 0x1f) == kSequenceParameterSet; });
      return set.empty() ? 0 : hash_of(set);
    }
  }
  return 0;
}

}  // namespace vexa

#include "host/recording/stream_parameters.h"

#include <span>
#include <vector>

namespace vexa::host {
namespace {

using Bytes = std::span<const unsigned char>;

constexpr unsigned kSequenceParameterSet = 7;
constexpr std::uint32_t kMacroblock = 16;         // pixels
constexpr std::uint32_t kMostMacroblocks = 1055;  // in one direction, at the highest level (A.3.1)
constexpr std::uint32_t kLargestCrop = kMostMacroblocks * kMacroblock;
constexpr double kFastest = 1000;  // pictures a second; above it the timing is not taken for one

// Reads bits forward. A read past the end gives 0 and is remembered.
class BitReader {
 public:
  explicit BitReader(Bytes bytes) : bytes_(bytes) {}

  [[nodiscard]] bool ok() const { return ok_; }

  std::uint32_t bits(unsigned count) {
    std::uint32_t value = 0;
    for (; count > 0; --count) value = value << 1 | bit();
    return value;
  }
  bool flag() { return bit() != 0; }

  // ue(v), 9.1
  std::uint32_t ue() {
    unsigned zeros = 0;
    while (ok_ && bit() == 0) ++zeros;
    if (zeros > 31) ok_ = false;
    if (!ok_) return 0;
    return (1u << zeros) - 1 + bits(zeros);
  }

  // se(v), 9.1.1
  std::int32_t se() {
    const std::uint32_t code = ue();
    const auto magnitude = static_cast<std::int32_t>(code / 2 + code % 2);
    return code % 2 == 1 ? magnitude : -magnitude;
  }

 private:
  std::uint32_t bit() {
    if (position_ >= bytes_.size() * 8) {
      ok_ = false;
      return 0;
    }
    const unsigned byte = bytes_[position_ / 8];
    const unsigned shift = 7 - static_cast<unsigned>(position_ % 8);
    ++position_;
    return byte >> shift & 1;
  }

  Bytes bytes_;
  std::size_t position_ = 0;
  bool ok_ = true;
};

bool is_start_code(Bytes bytes, std::size_t at) { return bytes[at] == 0 && bytes[at + 1] == 0 && bytes[at + 2] == 1; }

// The payload of the first unit of the type, without its header byte; empty when there is none.
Bytes find_unit(Bytes picture, unsigned type) {
  for (std::size_t at = 0; at + 4 <= picture.size(); ++at) {
    if (!is_start_code(picture, at) || (picture[at + 3] & 0x1f) != type) continue;
    const Bytes rest = picture.subspan(at + 4);
    std::size_t end = 0;
    while (end < rest.size() && !(end + 3 <= rest.size() && is_start_code(rest, end))) ++end;
    return rest.first(end);
  }
  return {};
}

// Takes out the 3 of every 0 0 3 (7.4.1).
std::vector<unsigned char> without_emulation_prevention(Bytes unit) {
  std::vector<unsigned char> out;
  unsigned zeros = 0;
  for (const unsigned char byte : unit) {
    if (zeros >= 2 && byte == 3) {
      zeros = 0;
      continue;
    }
    zeros = byte == 0 ? zeros + 1 : 0;
    out.push_back(byte);
  }
  return out;
}

void skip_scaling_list(BitReader& in, unsigned size) {
  std::int32_t last = 8;
  std::int32_t next = 8;
  for (unsigned i = 0; i < size && in.ok(); ++i) {
    if (next != 0) next = (last + in.se() % 256 + 256) % 256;
    if (next != 0) last = next;
  }
}

bool has_chroma_format(std::uint32_t profile) {
  switch (profile) {
    case 44:
    case 83:
    case 86:
    case 100:
    case 110:
    case 118:
    case 122:
    case 128:
    case 134:
    case 135:
    case 138:
    case 139:
    case 244:
      return true;
    default:
      return false;
  }
}

// Returns chroma_format_idc, 0 for separately coded colour planes.
std::uint32_t read_chroma_format(BitReader& in) {
  std::uint32_t format = in.ue();
  const unsigned lists = format == 3 ? 12 : 8;
  if (format == 3 && in.flag()) format = 0;
  in.ue();  // bit_depth_luma_minus8
  in.ue();  // bit_depth_chroma_minus8
  in.flag();
  if (in.flag()) {
    for (unsigned i = 0; i < lists && in.ok(); ++i) {
      if (in.flag()) skip_scaling_list(in, i < 6 ? 16 : 64);
    }
  }
  return format;
}

void skip_picture_order(BitReader& in) {
  const std::uint32_t type = in.ue();
  if (type == 0) in.ue();
  if (type != 1) return;
  in.flag();
  in.se();
  in.se();
  for (std::uint32_t count = in.ue(); count > 0 && in.ok(); --count) in.se();
}

struct PictureArea {
  std::uint32_t width = 0;
  std::uint32_t height = 0;
};

PictureArea read_area(BitReader& in, std::uint32_t chroma_format) {
  const std::uint32_t columns = in.ue() + 1;
  const std::uint32_t rows = in.ue() + 1;
  const bool frames_only = in.flag();
  if (!frames_only) in.flag();
  in.flag();  // direct_8x8_inference_flag
  if (columns > kMostMacroblocks || rows > kMostMacroblocks) return {};
  const std::uint32_t fields = frames_only ? 1 : 2;
  PictureArea area{columns * kMacroblock, rows * kMacroblock * fields};
  if (!in.flag()) return area;
  std::uint32_t crop[4];  // left, right, top, bottom
  for (std::uint32_t& side : crop) {
    side = in.ue();
    if (side > kLargestCrop) return {};
  }
  const std::uint32_t across = (crop[0] + crop[1]) * (chroma_format == 1 || chroma_format == 2 ? 2 : 1);
  const std::uint32_t down = (crop[2] + crop[3]) * (chroma_format == 1 ? 2 : 1) * fields;
  if (across >= area.width || down >= area.height) return {};
  return {area.width - across, area.height - down};
}

// Reads the usability information as far as the timing.
double read_frame_rate(BitReader& in) {
  constexpr std::uint32_t kOwnAspectRatio = 255;
  if (!in.flag()) return 0;
  if (in.flag() && in.bits(8) == kOwnAspectRatio) in.bits(32);
  if (in.flag()) in.flag();  // overscan
  if (in.flag()) {           // video signal type
    in.bits(4);
    if (in.flag()) in.bits(24);
  }
  if (in.flag()) {  // chroma sample location
    in.ue();
    in.ue();
  }
  if (!in.flag()) return 0;
  const std::uint32_t ticks = in.bits(32);
  const std::uint32_t scale = in.bits(32);
  if (!in.ok() || ticks == 0) return 0;
  const double rate = static_cast<double>(scale) / ticks / 2;  // a picture is two fields long
  return rate <= kFastest ? rate : 0;
}

}  // namespace

std::optional<StreamParameters> read_stream_parameters(const unsigned char* picture, std::size_t length) {
  const std::vector<unsigned char> unit =
      without_emulation_prevention(find_unit(Bytes(picture, length), kSequenceParameterSet));
  BitReader in(unit);
  const std::uint32_t profile = in.bits(8);
  in.bits(16);  // constraints and level
  in.ue();      // seq_parameter_set_id
  const std::uint32_t chroma_format = has_chroma_format(profile) ? read_chroma_format(in) : 1;
  in.ue();  // log2_max_frame_num_minus4
  skip_picture_order(in);
  in.ue();  // max_num_ref_frames
  in.flag();
  const PictureArea area = read_area(in, chroma_format);
  if (!in.ok() || area.width == 0) return std::nullopt;
  return StreamParameters{area.width, area.height, read_frame_rate(in)};
}

}  // namespace vexa::host

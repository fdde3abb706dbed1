// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/clip.h"

#include <cstring>
#include <fstream>
#include <iterator>
#include <sstream>
#include <utility>

namespace vexa::camera {
namespace {

using Bytes = std::span<const std::uint8_t>;

struct FoundUnit {
  std::size_t code = 0;   // where its start code begins
  std::size_t begin = 0;  // its header byte
  std::size_t end = 0;
};

// Offset of the next 00 00 01 at or after `from`; the size when there is none.
std::size_t next_code(Bytes bytes, std::size_t from) {
  for (std::size_t i = from + 2; i < bytes.size(); ++i) {
    const void* one = std::memchr(bytes.data() + i, 1, bytes.size() - i);
    if (one == nullptr) break;
    i = static_cast<std::size_t>(static_cast<const std::uint8_t*>(one) - bytes.data());
    if (bytes[i - 1] == 0 && bytes[i - 2] == 0) return i - 2;
  }
  return bytes.size();
}

std::vector<FoundUnit> find_units(Bytes bytes) {
  std::vector<FoundUnit> found;
  std::size_t code = next_code(bytes, 0);
  while (code < bytes.size()) {
    const std::size_t begin = code + 3;
    const std::size_t next = next_code(bytes, begin);
    std::size_t end = next;
    while (end > begin && bytes[end - 1] == 0) --end;
    const bool four_bytes = code > 0 && bytes[code - 1] == 0;
    if (end > begin) found.push_back({four_bytes ? code - 1 : code, begin, end});
    code = next;
  }
  return found;
}

bool is_slice(std::uint8_t type) { return type >= 1 && type <= 5; }

// Whether a NAL unit is the first of a new access unit, once the one before holds a slice (7.4.1.2.3). A picture's
// first slice starts at macroblock 0, whose Exp-Golomb code is a single 1 bit.
bool opens_access_unit(Bytes unit) {
  const std::uint8_t type = unit[0] & 0x1FU;
  if (is_slice(type)) return unit.size() > 1 && (unit[1] & 0x80U) != 0;
  return (type >= 6 && type <= 9) || (type >= 14 && type <= 18);
}

class Splitter {
 public:
  explicit Splitter(Bytes bytes) : bytes_(bytes) {}

  std::vector<AccessUnit> split() {
    const std::vector<FoundUnit> units = find_units(bytes_);
    for (const FoundUnit& unit : units) take(unit);
    if (!current_.units.empty()) close(bytes_.size());
    return std::move(done_);
  }

 private:
  void take(const FoundUnit& unit) {
    const Bytes nal = bytes_.subspan(unit.begin, unit.end - unit.begin);
    if (has_slice_ && opens_access_unit(nal)) close(unit.code);
    if (current_.units.empty()) start_ = unit.code;
    const std::uint8_t type = nal[0] & 0x1FU;
    current_.units.push_back({unit.begin - start_, nal.size(), type});
    current_.key = current_.key || type == 5;
    has_slice_ = has_slice_ || is_slice(type);
  }

  void close(std::size_t end) {
    const Bytes bytes = bytes_.subspan(start_, end - start_);
    current_.bytes.assign(bytes.begin(), bytes.end());
    done_.push_back(std::move(current_));
    current_ = {};
    has_slice_ = false;
  }

  Bytes bytes_;
  std::vector<AccessUnit> done_;
  AccessUnit current_;
  std::size_t start_ = 0;
  bool has_slice_ = false;
};

}  // namespace

std::vector<std::uint8_t> AccessUnit::as_delivered() const {
  static constexpr std::uint8_t kStartCode[] = {0, 0, 0, 1};
  std::vector<std::uint8_t> picture;
  picture.reserve(bytes.size() + units.size());
  for (const NalUnit& nal : units) {
    picture.insert(picture.end(), std::begin(kStartCode), std::end(kStartCode));
    const Bytes body = unit(nal);
    picture.insert(picture.end(), body.begin(), body.end());
  }
  return picture;
}

Clip Clip::from_annex_b(std::span<const std::uint8_t> bytes) {
  Clip clip;
  clip.access_units_ = Splitter(bytes).split();
  return clip;
}

std::vector<std::string> Clip::delivered() const {
  std::vector<std::string> pictures;
  for (const AccessUnit& picture : access_units_) {
    const std::vector<std::uint8_t> bytes = picture.as_delivered();
    pictures.emplace_back(reinterpret_cast<const char*>(bytes.data()), bytes.size());
  }
  return pictures;
}

std::optional<Clip> Clip::load(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream contents;
  contents << file.rdbuf();
  const std::string bytes = std::move(contents).str();
  Clip clip = from_annex_b({reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()});
  if (clip.access_units_.empty()) return std::nullopt;
  return clip;
}

}  // namespace vexa::camera

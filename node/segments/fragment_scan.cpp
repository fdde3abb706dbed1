// SPDX-License-Identifier: Apache-2.0
#include "node/segments/fragment_scan.h"

#include <optional>
#include <string_view>

namespace vexa::node {
namespace {

struct Box {
  char type[4] = {};
  std::uint64_t size = 0;

  [[nodiscard]] bool is(std::string_view name) const { return std::string_view(type, sizeof type) == name; }
};

std::uint64_t big_endian(const unsigned char* bytes, std::size_t length) {
  std::uint64_t value = 0;
  for (std::size_t i = 0; i < length; ++i) value = value << 8 | bytes[i];
  return value;
}

// A box that ends within the file.
std::optional<Box> box_at(const ReadAt& read, std::uint64_t at, std::uint64_t file_size) {
  constexpr std::size_t kShort = 8, kLong = 16;
  unsigned char header[kLong];
  if (file_size - at < kShort || !read(at, header, kShort)) return std::nullopt;
  Box box;
  for (std::size_t i = 0; i < sizeof box.type; ++i) box.type[i] = static_cast<char>(header[4 + i]);
  box.size = big_endian(header, 4);
  std::size_t least = kShort;
  if (box.size == 1) {
    if (file_size - at < kLong || !read(at, header, kLong)) return std::nullopt;
    box.size = big_endian(header + kShort, 8);
    least = kLong;
  }
  if (box.size < least || box.size > file_size - at) return std::nullopt;
  return box;
}

}  // namespace

FragmentScan scan_fragments(const ReadAt& read, std::uint64_t file_size) {
  FragmentScan scan;
  bool has_header = false;  // a "moov" box came
  bool after_moof = false;
  std::uint64_t at = 0;
  while (const auto box = box_at(read, at, file_size)) {
    at += box->size;
    const bool fragment = after_moof && box->is("mdat");
    if (box->is("moov")) has_header = true;
    after_moof = box->is("moof");
    if (!has_header || after_moof) continue;
    if (fragment) ++scan.fragments;
    scan.whole = at;
  }
  return scan;
}

}  // namespace vexa::node

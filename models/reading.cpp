// SPDX-License-Identifier: Apache-2.0
#include "models/reading.h"

#include <charconv>

namespace vexa::models {
namespace {

// Takes one to four digits that do not begin with 0.
bool take_side(std::string_view& text, std::int32_t& side) {
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), side);
  const auto digits = static_cast<std::size_t>(end - text.data());
  const bool taken = error == std::errc() && side > 0 && digits <= 4 && text.front() != '0';
  text.remove_prefix(digits);
  return taken;
}

bool take_size(std::string_view text, SLibDResolutionInfo& size) {
  if (!take_side(text, size.width) || !text.starts_with('x')) return false;
  text.remove_prefix(1);
  return take_side(text, size.height) && text.empty();
}

}  // namespace

std::vector<std::int32_t> read_ascending(const Part& list, Complaints& complaints) {
  std::vector<std::int32_t> numbers;
  for (const Part& item : list.items()) {
    complaints.demand(numbers.empty() || numbers.back() < item.number(), item, "must be above the one before it");
    numbers.push_back(item.number());
  }
  return numbers;
}

SLibDResolutionInfo read_size(const Part& size, Complaints& complaints) {
  SLibDResolutionInfo info;
  info.text = size.text();
  complaints.demand(take_size(info.text, info), size, "must be WIDTHxHEIGHT in pixels, for instance \"640x480\"");
  return info;
}

}  // namespace vexa::models

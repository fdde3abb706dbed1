// SPDX-License-Identifier: Apache-2.0
#include "filter/size_criteria.h"

#include <cstdio>

namespace vexa::filter {
namespace {

bool fits(Size size, Size limit) { return size.width <= limit.width && size.height <= limit.height; }

/// Takes the size that the value names. A value that does not read leaves the criterion as it is; a side that is not
/// above 0 means that no size is given.
void take_size(const std::string& value, std::optional<Size>& criterion) {
  Size size{};
  if (std::sscanf(value.c_str(), "%9d,%9d", &size.width, &size.height) != 2) return;
  criterion.reset();
  if (size.width > 0 && size.height > 0) criterion = size;
}

}  // namespace

bool is_wide(Size size) { return 5LL * size.width >= 8LL * size.height; }

void SizeCriteria::set(std::string_view item, const std::string& value) {
  if (item == "ImageMaxSizeFilter") take_size(value, max_size_);
  if (item == "VideoCapSizeFilter") take_size(value, capture_size_);
  if (item == "SolidPTZFilter" && (value == "on" || value == "off")) solid_ptz_ = value == "on";
}

bool SizeCriteria::admits(Size size) const {
  if (max_size_ && !fits(size, *max_size_)) return false;
  if (capture_size_ && (!fits(size, *capture_size_) || is_wide(size) != is_wide(*capture_size_))) return false;
  return !solid_ptz_ || fits(size, largest_moving_);
}

}  // namespace vexa::filter

// SPDX-License-Identifier: Apache-2.0
// The criteria that narrow a family's sizes.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "filter/model_family.h"

namespace vexa::filter {

/// True for pictures at least 8:5: 16:9 and what encoders round it to. All others count as 4:3.
bool is_wide(Size size);

/// Decides which sizes are offered under the criteria set so far. Owned by a resolution filter; one thread at a time.
class SizeCriteria {
 public:
  /// Forgets all criteria; `largest_moving` bounds pictures once solid PTZ is on.
  explicit SizeCriteria(Size largest_moving) : largest_moving_(largest_moving) {}

  /// Items and values as CResolutionFilterFacade::SetFilterItemCriteria takes them.
  void set(std::string_view item, const std::string& value);
  bool admits(Size size) const;

 private:
  std::optional<Size> max_size_;
  std::optional<Size> capture_size_;
  bool solid_ptz_ = false;
  Size largest_moving_;
};

}  // namespace vexa::filter

// SPDX-License-Identifier: Apache-2.0
// Detection records as tests write and compare them.
#pragma once

#include <string>
#include <vector>

#include "vexa/io_info.h"

namespace vexa_test {

/// Every field of a window, its area's points in a row at the end.
inline std::vector<int> window_row(const SLibDDetectionWindow& w) {
  std::vector<int> row = {w.enabled,         w.mode,       w.minObjectWidth, w.minObjectHeight, w.maxObjectWidth,
                          w.maxObjectHeight, w.sensitivity};
  for (const SLibDCommonPosition& point : w.area) row.insert(row.end(), {point.x, point.y});
  return row;
}

/// Every field of a setting: its two numbers, then its windows.
inline std::vector<std::vector<int>> setting_rows(const SLibDDetectionParam& param) {
  std::vector<std::vector<int>> rows = {{param.number, param.reserved2}};
  for (const SLibDDetectionWindow& window : param.windows) rows.push_back(window_row(window));
  return rows;
}

inline std::vector<int> numbers_of(const std::vector<SLibDDetectionParam>& settings) {
  std::vector<int> numbers;
  for (const SLibDDetectionParam& setting : settings) numbers.push_back(setting.number);
  return numbers;
}

/// A setting no two fields of which are alike.
inline SLibDDetectionParam marked_setting(int number) {
  SLibDDetectionParam param;
  param.number = number;
  int mark = 10;
  for (SLibDDetectionWindow& window : param.windows) {
    window.enabled = mark % 2;
    window.mode = mark % 3 == 0 ? 0 : 1;
    window.area = {{mark, mark + 1}, {mark + 2, mark + 3}};
    mark += 7;
  }
  for (SLibDDetectionWindow& window : param.windows) {
    window.minObjectWidth = 101;
    window.minObjectHeight = 102;
    window.maxObjectWidth = 103;
    window.maxObjectHeight = 104;
    window.sensitivity = 42;
  }
  return param;
}

}  // namespace vexa_test

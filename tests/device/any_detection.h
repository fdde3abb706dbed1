// SPDX-License-Identifier: Apache-2.0
// Detection settings of every kind, for properties.
#pragma once

#include <rapidcheck.h>

#include "tests/device/detection_records.h"

namespace vexa_test {

inline SLibDDetectionWindow any_window() {
  SLibDDetectionWindow window;
  window.enabled = *rc::gen::arbitrary<int>();
  window.mode = *rc::gen::arbitrary<int>();
  window.area = {{*rc::gen::arbitrary<int>(), *rc::gen::arbitrary<int>()},
                 {*rc::gen::arbitrary<int>(), *rc::gen::arbitrary<int>()}};
  return window;
}

/// A setting with two corners in each window and a sensitivity that cameras take; all else is any number.
inline SLibDDetectionParam any_setting(int number) {
  SLibDDetectionParam param;
  param.number = number;
  for (SLibDDetectionWindow& window : param.windows) window = any_window();
  SLibDDetectionWindow& first = param.windows[0];
  first.minObjectWidth = *rc::gen::arbitrary<int>();
  first.minObjectHeight = *rc::gen::arbitrary<int>();
  first.maxObjectWidth = *rc::gen::arbitrary<int>();
  first.maxObjectHeight = *rc::gen::arbitrary<int>();
  first.sensitivity = *rc::gen::inRange(1, 101);
  return param;
}

/// What an answer can contain of a setting.
inline SLibDDetectionParam as_told(SLibDDetectionParam param) {
  const SLibDDetectionWindow first = param.windows[0];
  for (SLibDDetectionWindow& w : param.windows) {
    w.enabled = w.enabled == 1 ? 1 : 0;
    w.mode = w.mode == 0 ? 0 : 1;
    w.minObjectWidth = first.minObjectWidth;
    w.minObjectHeight = first.minObjectHeight;
    w.maxObjectWidth = first.maxObjectWidth;
    w.maxObjectHeight = first.maxObjectHeight;
    w.sensitivity = first.sensitivity;
  }
  return param;
}

}  // namespace vexa_test

// SPDX-License-Identifier: Apache-2.0
// Detection settings of every kind: what is sent reads back as it was.
#include <gtest/gtest.h>
#include <rapidcheck.h>
#include <rapidcheck/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

#include "device/cgi/detection_text.h"
#include "tests/device/any_detection.h"

namespace vexa {
namespace {

using vexa_test::any_setting;
using vexa_test::as_told;
using vexa_test::setting_rows;

/// Two digits at least, zeros and a sign among them.
std::string two_digits(int number) {
  const std::string plain = std::to_string(number);
  return plain.size() < 2 ? "0" + plain : plain;
}

std::string expected_sizes(const SLibDDetectionParam& param) {
  const std::string od = "Od" + two_digits(param.number);
  const SLibDDetectionWindow& w = param.windows[0];
  std::string text = "/command/objectdetection.cgi?";
  for (const char* colour : {"R", "G", "B"}) {
    text += od + "Threshold" + colour + "=" + std::to_string(w.sensitivity) + "&";
  }
  text += od + "MinObjectSize=" + std::to_string(w.minObjectWidth) + "," + std::to_string(w.minObjectHeight) + "&";
  return text + od + "MaxObjectSize=" + std::to_string(w.maxObjectWidth) + "," + std::to_string(w.maxObjectHeight);
}

std::string expected_windows(const SLibDDetectionParam& param, int first) {
  std::string text = "/command/objectdetection.cgi?";
  for (const int k : {first, first + 1}) {
    const SLibDDetectionWindow& w = param.windows[k - 1];
    const std::string win = "Od" + two_digits(param.number) + "Win" + std::to_string(k);
    text += k == first ? "" : "&";
    text += win + (w.enabled == 1 ? "=on&" : "=off&") + win + "Area=";
    for (const SLibDCommonPosition& p : w.area) text += std::to_string(p.x) + "," + std::to_string(p.y) + ",";
    text.back() = '&';
    text += win + (w.mode == 0 ? "Mode=det" : "Mode=mask");
  }
  return text;
}

std::string items_of(const std::string& request) { return "&" + request.substr(request.find('?') + 1); }

std::string answer_items(const SLibDDetectionParam& param) {
  return items_of(object_size_request(param)) + items_of(first_windows_request(param)) +
         items_of(last_windows_request(param));
}

RC_GTEST_PROP(DetectionRequests, AreByteForByteWhatTheRecordSays, ()) {
  const SLibDDetectionParam param = any_setting(*rc::gen::inRange(0, 200));
  RC_ASSERT(object_size_request(param) == expected_sizes(param));
  RC_ASSERT(first_windows_request(param) == expected_windows(param, 1));
  RC_ASSERT(last_windows_request(param) == expected_windows(param, 3));
}

RC_GTEST_PROP(DetectionRequests, ReadBackEqual, ()) {
  const int presets = *rc::gen::inRange(0, 18);
  std::string answer = "PositionMode=preset&ODPreDef=0";
  std::vector<SLibDDetectionParam> sent;
  for (int number = 1; number <= presets; ++number) sent.push_back(any_setting(number));
  sent.push_back(any_setting(99));
  for (const SLibDDetectionParam& param : sent) answer += answer_items(param);
  const auto read = object_settings(answer, true);
  RC_ASSERT(read.size() == sent.size());
  for (std::size_t i = 0; i < read.size(); ++i) {
    RC_ASSERT(setting_rows(read[i]) == setting_rows(as_told(sent[i])));
  }
}

}  // namespace
}  // namespace vexa

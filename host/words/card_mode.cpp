// SPDX-License-Identifier: Apache-2.0
#include "host/words/card_mode.h"

#include <string>

#include "host/base/number_text.h"

namespace vexa::host {
namespace {

// Removes the text up to `separator` from the front of `text`, and the separator, and returns it.
std::string_view take_until(std::string_view& text, char separator) {
  const std::string_view front = text.substr(0, text.find(separator));
  text.remove_prefix(front.size() < text.size() ? front.size() + 1 : front.size());
  return front;
}

// "image2,off": the recorded stream, and whether its sound is recorded too.
int stream_number(std::string_view value) {
  constexpr std::string_view kWord = "image";
  if (!value.starts_with(kWord)) return 1;
  value.remove_prefix(kWord.size());
  return take_number<int>(value).value_or(1);
}

void take_pair(std::string_view key, std::string_view value, SLibDEdgeStorageMode& mode) {
  if (key == "Edgestorage") mode.enabled = value == "on";
  if (key == "EsRec1") mode.imageNumber = stream_number(value);
  if (key == "EsAlmRec1WatchAddress") mode.watchAddress = std::string(value);
  if (key == "EsAlmRec1Time") {
    std::string_view before = take_until(value, ',');
    mode.alarmTime1 = take_number<int>(before).value_or(0);
    mode.alarmTime2 = take_number<int>(value).value_or(0);
  }
}

}  // namespace

SLibDEdgeStorageMode read_card_mode(std::string_view answer) {
  SLibDEdgeStorageMode mode;
  mode.imageNumber = 1;
  while (!answer.empty()) {
    std::string_view value = take_until(answer, '&');
    const std::string_view key = take_until(value, '=');
    take_pair(key, value, mode);
  }
  return mode;
}

}  // namespace vexa::host

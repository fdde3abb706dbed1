// SPDX-License-Identifier: Apache-2.0
// Answers about detection, of both kinds of camera: what is read of any bytes can be sent, and reads back equal.
#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>

#include "device/cgi/detection_text.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

std::string items_of(const std::string& request) { return "&" + request.substr(request.find('?') + 1); }

bool same_area(const SLibDDetectionWindow& a, const SLibDDetectionWindow& b) {
  return a.area.size() == 2 && b.area.size() == 2 && a.area[0].x == b.area[0].x && a.area[0].y == b.area[0].y &&
         a.area[1].x == b.area[1].x && a.area[1].y == b.area[1].y;
}

void check_sent(const SLibDDetectionParam& param) {
  if (!vexa::has_areas(param)) return;
  const std::string answer = "ODPreDef=0" + items_of(vexa::object_size_request(param)) +
                             items_of(vexa::first_windows_request(param)) + items_of(vexa::last_windows_request(param));
  const auto read = vexa::object_settings(answer + "&Od99Mode=x", true);
  check(!read.empty() && read.front().number == param.number);
  for (std::size_t k = 0; k < 4; ++k) {
    const SLibDDetectionWindow& sent = param.windows[k];
    const SLibDDetectionWindow& back = read.front().windows[k];
    check(same_area(sent, back) && back.enabled == (sent.enabled == 1 ? 1 : 0));
    check(back.mode == (sent.mode != 0 ? 1 : 0) && back.sensitivity == param.windows[0].sensitivity);
  }
}

void check_objects(std::string_view answer, bool presets) {
  const auto settings = vexa::object_settings(answer, presets);
  check(settings.size() <= answer.size() / 4);
  for (const SLibDDetectionParam& setting : settings) {
    check(setting.number != -1 && (presets || setting.number == 99));
    for (const SLibDDetectionWindow& window : setting.windows) check(window.area.empty() || window.area.size() == 2);
    check_sent(setting);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view answer(reinterpret_cast<const char*>(data), size);
  check_objects(answer, true);
  check_objects(answer, false);
  const auto mode = vexa::position_mode_of(answer);
  check(!mode || *mode == LIBD_POSITION_CURRENT || *mode == LIBD_POSITION_PRESET);
  const auto lod = vexa::lod_settings(answer);
  check(lod.empty() || lod.size() == 17);
  for (const auto& setting : lod)
    check(setting.windows[0].minObjectWidth >= 0 && setting.windows[0].minObjectWidth < 3);
  return 0;
}

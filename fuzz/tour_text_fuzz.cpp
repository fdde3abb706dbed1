// SPDX-License-Identifier: Apache-2.0
// Camera tours and shadow tours: any answer can be read, and what was read is either refused or set again in
// a request that holds no other command.
#include <cstdint>
#include <cstdlib>
#include <string>

#include "device/cgi/tour_text.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

constexpr char kRequestCharacters[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789-,=&";

bool is_plain(const std::string& request) { return request.find_first_not_of(kRequestCharacters) == std::string::npos; }

void check_tours(const std::string& answer, int count) {
  const SLibDCameraTourInfo info = vexa::read_camera_tours(answer, count);
  check(info.tours.size() <= 5);
  for (const auto& [number, tour] : info.tours) {
    check(number >= 1 && number <= 5);
    check(tour.sequence.size() != 1 && tour.sequence.size() <= answer.size());
  }
  const auto request = vexa::camera_tour_request(info, count, 16);
  if (!request) return;
  check(is_plain(*request));
  const auto again = vexa::camera_tour_request(vexa::read_camera_tours("&" + *request, count), count, 16);
  check(again == request);
}

void check_shadow_tours(const std::string& answer, int count) {
  const SLibDShadowTourInfo info = vexa::read_shadow_tours(answer, count);
  check(info.tours.size() <= 5);
  const auto request = vexa::shadow_tour_request(info, count);
  if (!request) return;
  check(is_plain(*request));
  check(vexa::shadow_tour_request(vexa::read_shadow_tours("&" + *request, count), count) == request);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const int count = static_cast<std::int8_t>(data[0]);
  const std::string answer(reinterpret_cast<const char*>(data) + 1, size - 1);
  check_tours(answer, count);
  check_shadow_tours(answer, count);
  return 0;
}

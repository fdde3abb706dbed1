// SPDX-License-Identifier: Apache-2.0
// Profiles of camera models: a wrong one is refused whole, with the line of what is wrong; and the virtual camera takes
// the very profiles that the library takes.
#include <algorithm>
#include <memory>
#include <string>

#include "fuzz/check.h"
#include "vexa/models.h"
#include "virtual_camera/model/camera_profile.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using vexa_fuzz::check;
  const std::string text(vexa_fuzz::text_of(data, size));
  vexa::Profile profile;
  profile.model = "from before";
  vexa::ProfileError error;
  const bool taken = vexa::ParseProfile(text, "fuzzed", profile, error);
  const auto lines = static_cast<int>(std::count(text.begin(), text.end(), '\n')) + 1;
  if (taken) {
    check(profile.name == "fuzzed" && vexa::MakeDevice(profile) != nullptr);
  } else {
    check(profile.model == "from before" && profile.name.empty());
    check(!error.text.empty() && error.line >= 0 && error.line <= lines && !error.Message().empty());
  }
  const auto camera = vexa::camera::parse_camera_profile(text, "fuzzed");
  check(taken == std::holds_alternative<vexa::camera::CameraProfile>(camera));
  return 0;
}

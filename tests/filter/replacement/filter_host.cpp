// SPDX-License-Identifier: Apache-2.0
// A host that prints what its driver offers after each property it sets, or after each answer of a camera that it is
// given on its command line.
#include <climits>
#include <cstdio>
#include <string>
#include <vector>

#include "tests/support/own_address.h"
#include "vexa/vexa_common.h"
#include "virtual_camera/virtual_camera.h"

namespace {

class Model : public CVexaCommon {
 public:
  Model() {
    m_FixedSystemInfo.modelName = "LMX-C100";
    m_FixedCameraInfoAvailable = true;
  }

  void use(const vexa::camera::VirtualCamera& camera) {
    m_ConnectionInfo.host = camera.address();
    m_ConnectionInfo.port = camera.http_port();
    m_ConnectionInfo.timeout = 10000;
    m_ConnectionInfo.userName = m_ConnectionInfo.password = "admin";
  }
};

void print_offer(Model& driver) {
  SLibDFixedCameraInfo info;
  driver.GetFixedCameraInfo(info);
  for (const SLibDVideoCodecInfo& codec : info.codecs) {
    std::printf("%s=%s ", codec.name.c_str(), codec.resolutions.empty() ? "" : codec.resolutions[0].text.c_str());
  }
  std::printf("\n");
}

void set_properties() {
  Model driver;
  driver.SetVidCapSize(INT_MIN, INT_MIN);
  print_offer(driver);
  driver.SetVidCapSize(384, 288);
  print_offer(driver);
  driver.SetSolidPTZState(true);
  print_offer(driver);
  driver.SetSolidPTZState(false);
  print_offer(driver);
  driver.SetImageMaxSize(INT_MIN, INT_MIN, LIBD_VIDEO_PAL);
  print_offer(driver);
}

// One driver reads one answer after the other.
int read_answers(const std::vector<std::string>& answers) {
  vexa::camera::CameraOptions options;
  options.address = vexa_test::own_loopback(0);
  options.rtsp_port = 0;
  vexa::camera::VirtualCamera camera(options);
  if (!camera.start()) return 1;
  Model driver;
  driver.use(camera);
  for (const std::string& answer : answers) {
    camera.settings().set_answer("camera", answer);
    SLibDCameraInfo info;
    if (driver.GetCameraInfo(info) != LIBD_OK) return 1;
    print_offer(driver);
  }
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc > 1) return read_answers({argv + 1, argv + argc});
  set_properties();
  return 0;
}

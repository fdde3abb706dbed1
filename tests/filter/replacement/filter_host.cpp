// A host that prints what its driver offers after each property it sets.
#include <climits>
#include <cstdio>

#include "vexa/vexa_common.h"

namespace {

class Model : public CVexaCommon {
 public:
  Model() {
    m_FixedSystemInfo.modelName = "LMX-C100";
    m_FixedCameraInfoAvailable = true;
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

}  // namespace

int main() {
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
  return 0;
}

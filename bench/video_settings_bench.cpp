// SPDX-License-Identifier: Apache-2.0
// Reading the settings of one video stream out of a camera's answer, as GetCameraInfo does once it has the answer.
#include <benchmark/benchmark.h>

#include <string>

#include "device/driver_state.h"

namespace {

const std::string kAnswer =
    "VideoStd=pal&VidCapSize=1920,1080&SolidPTZ=off&ImageMaxSize=1920,1080&ImageCodec1=h264&ImageSize1=1920,1080&"
    "FrameRate1=25&BitRate1=8000&Quality1=5&ImageCodec2=jpeg&ImageSize2=640,480&FrameRate2=5&BitRate2=512&Quality2=5&"
    "UcVideoPort=1024&UcVideoPort1=1026&UcVideoPort2=1028&RTSPPort=554&ExpMode=full&Shutter=20&Iris=7&BLComp=off&"
    "DayNightMode=auto&DayNight=off&XDNR=mid&ViewDR=off&VisibilityEnhancer=off&IRLed=off&IRLedMaxStrength=10";

class Reader : public CVexaCommon {
 public:
  void read(const std::string& answer) {
    m_State->store_camera_inquiry({});
    m_State->store_camera_inquiry(answer);
    SLibDCameraInfo info;
    info.streamNumber = 1;
    m_State->read_camera_answer(answer, info);
  }

  void forget() { m_CameraInfo = SLibDCameraInfo(); }
};

void settings_unchanged(benchmark::State& state) {
  Reader reader;
  for (auto _ : state) reader.read(kAnswer);
}
BENCHMARK(settings_unchanged);

void settings_changed_and_refiltered(benchmark::State& state) {
  Reader reader;
  for (auto _ : state) {
    reader.forget();
    reader.read(kAnswer);
  }
}
BENCHMARK(settings_changed_and_refiltered);

}  // namespace

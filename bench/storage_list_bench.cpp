// SPDX-License-Identifier: Apache-2.0
// Reading the camera's list of recordings.
#include <benchmark/benchmark.h>

#include <string>

#include "device/cgi/storage_text.h"

namespace {

std::string list_of(std::int64_t count) {
  std::string text;
  for (std::int64_t i = 0; i < count; ++i) {
    text += "StreamName=20240131_235959_" + std::to_string(i) +
            ",Start=20240131T235959,End=20240201T000100,ImageCodec=h264,ImageSize=1920,1080,FrameRate=25,BitRate=8000,"
            "AudioCodec=g711,Size=123456,Status=normal\r\n";
  }
  return text;
}

void recordings(benchmark::State& state) {
  const std::string answer = list_of(state.range(0));
  for (auto _ : state) benchmark::DoNotOptimize(vexa::read_recordings(answer));
  state.counters["answer_bytes"] = static_cast<double>(answer.size());
}
BENCHMARK(recordings)->Arg(1000)->Arg(100000)->Unit(benchmark::kMillisecond);

}  // namespace

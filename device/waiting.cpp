// Waiting for what drivers have for their host.
#include "vexa/waiting.h"

#include "device/driver_state.h"
#include "runtime/base/result.h"

namespace vexa {

int VideoFrameDescriptor(CVexaCommon& driver) { return DriverState::of(driver).readiness.video_descriptor(); }

bool WaitForVideoFrame(CVexaCommon& driver, int milliseconds) {
  return DriverState::of(driver).readiness.wait_for_video(milliseconds);
}

std::uint32_t ReadyStreams(CVexaCommon& driver, std::uint32_t wanted) {
  return DriverState::of(driver).readiness.ready(wanted);
}

void SetPromptFrames(CVexaCommon& driver, bool prompt) { DriverState::of(driver).prompt_frames = prompt; }

WaitSet::WaitSet() {
  if (!within_memory([&] { group_ = std::make_shared<WaitGroup>(); })) group_.reset();
}

WaitSet::~WaitSet() {
  if (group_ != nullptr) group_->close();
}

bool WaitSet::Add(CVexaCommon& driver, std::uint32_t streams) {
  return group_ != nullptr && DriverState::of(driver).readiness.join(group_, streams);
}

void WaitSet::Remove(CVexaCommon& driver) {
  if (group_ != nullptr) DriverState::of(driver).readiness.leave(*group_);
}

int WaitSet::Descriptor() { return group_ == nullptr ? kNoMemoryLeft : group_->descriptor(); }

int WaitSet::Wait(std::vector<ReadyDriver>& ready, int milliseconds) {
  ready.clear();
  return group_ == nullptr ? kNoMemoryLeft : group_->wait(ready, milliseconds);
}

}  // namespace vexa

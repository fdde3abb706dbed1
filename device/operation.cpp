// SPDX-License-Identifier: Apache-2.0
#include "device/operation.h"

#include <cstdio>
#include <cstring>
#include <utility>

#include "device/driver_state.h"
#include "vexa/failure.h"

namespace vexa {
namespace {

thread_local Operation* latest = nullptr;

}  // namespace

Operation::Operation(DriverState& state, const char* name)
    : state_(state),
      name_(name),
      before_(latest),
      root_(of(state.errors)),
      cancels_before_(state.cancellation.count()) {
  text_[0] = '\0';
  latest = this;
}

Operation::~Operation() {
  latest = before_;
  if (root_ != nullptr || !failed_) return;
  char camera[kCameraNameRoom];
  state_.connection.write_name(camera);
  state_.errors.enter({code_, cancelled_, name_, camera, text_});
  // Reads of a stream fail again and again while it is silent; StreamWatch notes the change.
  if (!state_.recorder.is_on() || std::strcmp(name_, kStreamingThread) == 0) return;
  char event[kTextRoom + 128];  // with the names of the operation and of the code
  std::snprintf(event, sizeof event, "%s: %s%s %s", name_, CodeName(code_), cancelled_ ? " (cancelled)" : "", text_);
  state_.recorder.note("call", event);
}

Operation* Operation::of(const ErrorRecord& errors) {
  for (Operation* each = latest; each != nullptr; each = each->before_) {
    if (&each->state_.errors == &errors) return each->root_ != nullptr ? each->root_ : each;
  }
  return nullptr;
}

void Operation::announce(FlightRecorder& recorder) {
  if (!recorder.is_on()) return;
  for (Operation* each = latest; each != nullptr; each = each->before_) {
    if (&each->state_.recorder != &recorder) continue;
    Operation& call = each->root_ != nullptr ? *each->root_ : *each;
    if (!std::exchange(call.announced_, true)) recorder.note("call", call.name_);
    return;
  }
}

Cancels Operation::cancels_of(const ErrorRecord& errors) {
  Operation* operation = of(errors);
  return operation == nullptr ? Cancels{} : operation->cancels();
}

Cancels Operation::cancels() {
  if (!ends_) ends_ = state_.cancellation.join(cancels_before_);
  return ends_->view();
}

bool Operation::is_cancelled() { return ends_ && ends_->view().raised(); }

void Operation::note(ELibDReturnCode code, const char* text) {
  failed_ = true;
  code_ = code;
  cancelled_ = cancelled_ || is_cancelled();
  if (text[0] != '\0') std::snprintf(text_, sizeof text_, "%s", text);
}

ELibDReturnCode Operation::returns(ELibDReturnCode code) {
  Operation& call = root_ != nullptr ? *root_ : *this;
  if (code != LIBD_OK && (code != LIBD_NO_FRAME || call.is_cancelled())) call.note(code);
  return code;
}

}  // namespace vexa

#include "device/error_record.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

#include "device/operation.h"

namespace vexa {

ErrorRecord::ErrorRecord(ELibDReturnCode& code, std::string& text) : code_(code), text_(text) {
  text_.reserve(kTextRoom);
}

void ErrorRecord::clear() {
  const Guard guard(lock_);
  code_ = LIBD_FAILED;
}

void ErrorRecord::record(const Failure& failure) {
  note(failure.code, failure.text.c_str());
  const Guard guard(lock_);
  if (failure.code != LIBD_FAILED) code_ = failure.code;
  if (!failure.text.empty()) text_ = failure.text;
}

// Without a Failure, whose text would need memory.
ELibDReturnCode ErrorRecord::out_of_memory() {
  char text[256];
  const char* reason = strerror_r(ENOMEM, text, sizeof text);  // the GNU form: returns where the text is
  note(LIBD_FAILED, reason);
  const Guard guard(lock_);
  code_ = LIBD_FAILED;
  text_ = reason;
  return LIBD_FAILED;
}

void ErrorRecord::enter(const FailedOperation& failed) {
  const Guard guard(lock_);
  last_ = failed;
  std::snprintf(last_camera_, sizeof last_camera_, "%s", failed.camera);
  std::snprintf(last_text_, sizeof last_text_, "%s", failed.text);
}

void ErrorRecord::note_returned(ELibDReturnCode code) const {
  if (Operation* operation = Operation::of(*this)) operation->returns(code);
}

// A failure outside every operation has no name.
void ErrorRecord::note(ELibDReturnCode code, const char* text) {
  if (Operation* operation = Operation::of(*this)) {
    operation->note(code, text);
  } else {
    enter({code, false, "", "", text});
  }
}

ELibDReturnCode ErrorRecord::code() {
  const Guard guard(lock_);
  return code_;
}

std::string ErrorRecord::text() {
  const Guard guard(lock_);
  return text_;
}

}  // namespace vexa

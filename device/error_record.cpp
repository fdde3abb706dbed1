#include "device/error_record.h"

#include <cerrno>
#include <cstring>

namespace vexa {
namespace {

/// Room for every text of an error, so that recording one does not allocate.
constexpr std::size_t kErrorRoom = 1024;

}  // namespace

ErrorRecord::ErrorRecord(ELibDReturnCode& code, std::string& text) : code_(code), text_(text) {
  text_.reserve(kErrorRoom);
}

void ErrorRecord::clear() {
  const Guard guard(lock_);
  code_ = LIBD_FAILED;
}

void ErrorRecord::record(const Failure& failure) {
  const Guard guard(lock_);
  if (failure.code != LIBD_FAILED) code_ = failure.code;
  if (!failure.text.empty()) text_ = failure.text;
}

// Without a Failure, whose text would need memory.
ELibDReturnCode ErrorRecord::out_of_memory() {
  char text[256];
  const char* reason = strerror_r(ENOMEM, text, sizeof text);  // the GNU form: returns where the text is
  const Guard guard(lock_);
  code_ = LIBD_FAILED;
  text_ = reason;
  return LIBD_FAILED;
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

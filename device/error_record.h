// The latest failure of a driver, and the boundary at which a member's work becomes its result.
#pragma once

#include <string>
#include <type_traits>
#include <utility>

#include "runtime/base/result.h"
#include "runtime/base/sync.h"

namespace vexa {

/// What most members' work comes to: the code to return, or a failure to record.
using Outcome = Result<ELibDReturnCode>;

/// What a member returns for a failure.
template <typename Value>
Value returned_for(ELibDReturnCode code) {
  if constexpr (std::is_same_v<Value, ELibDReturnCode>) return code;
  if constexpr (std::is_same_v<Value, bool>) return false;
  if constexpr (std::is_same_v<Value, int>) return -1;
}

/// Bytes of "HOST:PORT" with its terminator; a longer one is cut.
inline constexpr std::size_t kCameraNameRoom = 272;

/// An operation that failed; the texts are the owner's.
struct FailedOperation {
  ELibDReturnCode code = LIBD_OK;  ///< LIBD_OK: none has
  bool cancelled = false;
  const char* name = "";  ///< static
  const char* camera = "";
  const char* text = "";
};

/// Keeps the code and text that hosts read as the latest error; both are fields of the driver. Any thread. An operation
/// returns the code of its own failure and never reads it back here, where other threads' failures are recorded too.
class ErrorRecord {
 public:
  ErrorRecord(ELibDReturnCode& code, std::string& text);

  /// An exchange begins: the code is LIBD_FAILED until one fails with another; the text stays.
  void clear();
  /// Records a failure: its code unless that is LIBD_FAILED, its text unless that is empty.
  void record(const Failure& failure);
  ELibDReturnCode code();
  std::string text();

  /// Runs a member's work, which returns a Result. A failure is recorded and becomes its code, -1 or false. So does
  /// running out of memory, with LIBD_FAILED and the system's text, whatever the work was: nothing is thrown further.
  template <typename Work>
  auto run(Work&& work) {
    using Value = typename std::invoke_result_t<Work>::value_type;
    Value value = returned_for<Value>(LIBD_FAILED);
    const bool fitted = within_memory([&] {
      auto result = std::forward<Work>(work)();
      if (result) {
        value = std::move(*result);
        if constexpr (std::is_same_v<Value, ELibDReturnCode>) note_returned(value);
      } else {
        record(result.failure());
        value = returned_for<Value>(result.failure().code);
      }
    });
    if (!fitted) out_of_memory();
    return value;
  }

  /// Records that memory ran out; LIBD_FAILED. Allocates nothing.
  ELibDReturnCode out_of_memory();

  /// Keeps the latest operation that failed. Allocates nothing.
  void enter(const FailedOperation& failed);
  /// Hands the latest operation that failed to `use`, under the lock.
  template <typename Use>
  void with_last(Use&& use) {
    const Guard guard(lock_);
    std::forward<Use>(use)(FailedOperation{last_.code, last_.cancelled, last_.name, last_camera_, last_text_});
  }

 private:
  /// Room for every text of an error, so that recording one does not allocate.
  static constexpr std::size_t kTextRoom = 1024;

  void note_returned(ELibDReturnCode code) const;
  void note(ELibDReturnCode code, const char* text);

  CSimpleLock lock_;
  ELibDReturnCode& code_ VEXA_GUARDED_BY(lock_);
  std::string& text_ VEXA_GUARDED_BY(lock_);
  FailedOperation last_ VEXA_GUARDED_BY(lock_);  // its texts are these
  char last_camera_[kCameraNameRoom] VEXA_GUARDED_BY(lock_) = {};
  char last_text_[kTextRoom] VEXA_GUARDED_BY(lock_) = {};
};

}  // namespace vexa

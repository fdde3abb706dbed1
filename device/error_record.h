// The latest failure of a driver, and the boundary at which a member's work becomes its result.
#pragma once

#include <string>
#include <type_traits>
#include <utility>

#include "runtime/base/result.h"
#include "runtime/base/sync.h"

namespace vexa {

/// The result of most members' work: the code to return, or a failure to record.
using Outcome = Result<ELibDReturnCode>;

/// What a member returns for a failure.
template <typename Value>
Value returned_for(ELibDReturnCode code) {
  if constexpr (std::is_same_v<Value, ELibDReturnCode>) return code;
  if constexpr (std::is_same_v<Value, bool>) return false;
  if constexpr (std::is_same_v<Value, int>) return -1;
}

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
  /// running out of memory, with LIBD_FAILED and the system's text, whatever the work was: no exception passes.
  template <typename Work>
  auto run(Work&& work) {
    using Value = typename std::invoke_result_t<Work>::value_type;
    Value value = returned_for<Value>(LIBD_FAILED);
    const bool fitted = within_memory([&] {
      auto result = std::forward<Work>(work)();
      if (result) {
        value = std::move(*result);
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

 private:
  CSimpleLock lock_;
  ELibDReturnCode& code_ VEXA_GUARDED_BY(lock_);
  std::string& text_ VEXA_GUARDED_BY(lock_);
};

}  // namespace vexa

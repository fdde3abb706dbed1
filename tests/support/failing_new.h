// Lets one allocation fail. A test program that uses it has its operator new replaced.
#pragma once

namespace vexa_test {

/// While it lives, the calling thread's allocation number `nth`, counted from 0, fails once.
class AllocationFailure {
 public:
  explicit AllocationFailure(int nth);
  ~AllocationFailure();
  AllocationFailure(const AllocationFailure&) = delete;
  AllocationFailure& operator=(const AllocationFailure&) = delete;

  /// Whether the failure has come.
  bool happened() const;
};

}  // namespace vexa_test

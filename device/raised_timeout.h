// A longer time-out for as long as a slow request takes.
#pragma once

#include "runtime/base/sync.h"

namespace vexa {

/// Sets a time-out and puts another value back at the end of its life. Both writes are made under `lock`.
class RaisedTimeout {
 public:
  struct Values {
    int raised;    ///< milliseconds, set at once
    int restored;  ///< milliseconds, put back
  };

  RaisedTimeout(int& timeout, CSimpleLock& lock, Values values) : timeout_(timeout), lock_(lock), values_(values) {
    const Guard guard(lock_);
    timeout_ = values_.raised;
  }
  ~RaisedTimeout() {
    const Guard guard(lock_);
    timeout_ = values_.restored;
  }
  RaisedTimeout(const RaisedTimeout&) = delete;
  RaisedTimeout& operator=(const RaisedTimeout&) = delete;

 private:
  int& timeout_;
  CSimpleLock& lock_;
  Values values_;
};

}  // namespace vexa

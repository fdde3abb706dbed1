// SPDX-License-Identifier: Apache-2.0
// What becomes of cameras, on standard error.
#ifndef HOST_CAMERA_SESSION_NEWS_H_
#define HOST_CAMERA_SESSION_NEWS_H_

#include <set>
#include <string>

#include "host/console/line_budget.h"
#include "host/console/terminal.h"
#include "vexa/session_status.h"

namespace vexa::host {

// A line where a camera is not live, with the reason, and one when it is again; a bounded number a second. One thread.
class SessionNews {
 public:
  // The terminal outlives this.
  explicit SessionNews(Terminal& terminal) : terminal_(terminal) {}

  void show(const std::string& camera, const SessionStatus& status);

 private:
  Terminal& terminal_;
  LineBudget budget_;
  std::set<std::string> away_;
};

}  // namespace vexa::host

#endif  // HOST_CAMERA_SESSION_NEWS_H_

// SPDX-License-Identifier: Apache-2.0
// Failure lines of the runtime on standard error.
#pragma once

namespace vexa {

/// Writes one line through OutputDebugString: `format` and its arguments, whatever their length, and a line feed.
__attribute__((format(printf, 1, 2))) void debug_line(const char* format, ...);

/// The system's text for an error code, safe in any thread.
class ErrorText {
 public:
  explicit ErrorText(int code);
  const char* c_str() const { return text_; }

 private:
  char buffer_[128];
  const char* text_;
};

}  // namespace vexa

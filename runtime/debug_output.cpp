// SPDX-License-Identifier: Apache-2.0
#include "runtime/debug_output.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "vexa/runtime.h"

namespace vexa {

void debug_line(const char* format, ...) {
  char* line = nullptr;
  std::va_list arguments;
  va_start(arguments, format);
  const int length = vasprintf(&line, format, arguments);
  va_end(arguments);
  if (length < 0) return;
  OutputDebugString(line);
  std::free(line);
}

ErrorText::ErrorText(int code) : buffer_{}, text_(strerror_r(code, buffer_, sizeof buffer_)) {}

}  // namespace vexa

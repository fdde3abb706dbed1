// SPDX-License-Identifier: Apache-2.0
#include "runtime/handle.h"

#include <unistd.h>

#include <cerrno>
#include <memory>

#include "runtime/debug_output.h"

namespace vexa {

FileHandle* check_file_handle(typedHandle* h) {
  auto* file = record_of<FileHandle>(h);
  if (file == nullptr) debug_line("checkFileHandle : called with invalid handle");
  return file;
}

}  // namespace vexa

int CloseHandle(typedHandle* h) {
  if (h == nullptr) return 0;
  switch (h->kind) {
    case HANDLE_TYPE_EVENT:
      return CloseEventHandle(h);
    case HANDLE_TYPE_THREAD:
      return CloseThreadHandle(h);
    case HANDLE_TYPE_FILE:
      return CloseFileHandle(h);
    default:
      return 0;
  }
}

int CloseFileHandle(typedHandle* h) {
  const std::unique_ptr<vexa::FileHandle> file(vexa::check_file_handle(h));
  if (file == nullptr) return 0;
  if (close(file->fd) == 0) return 1;
  vexa::debug_line("CloseFileHandle fclose: %s", vexa::ErrorText(errno).c_str());
  return 0;
}

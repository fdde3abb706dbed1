// SPDX-License-Identifier: Apache-2.0
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <string_view>

#include "runtime/debug_output.h"
#include "runtime/file_status.h"
#include "runtime/handle.h"
#include "vexa/runtime.h"

namespace {

using vexa::FindHandle;

constexpr std::string_view kAlternateName = "xxxxxxxx.xxx";

FindHandle* check_find_handle(typedHandle* h) {
  auto* find = vexa::record_of<FindHandle>(h);
  if (find == nullptr) vexa::debug_line("checkFindFirstFileHandle : called with invalid handle");
  return find;
}

template <std::size_t kRoom>
void copy_name(std::string_view name, char (&output)[kRoom]) {
  const std::size_t length = std::min(name.size(), kRoom - 1);
  std::copy_n(name.begin(), length, output);
  output[length] = '\0';
}

/// Describes the search's present match; 0 when there is none or it cannot be read.
int fill(const FindHandle& find, _WIN32_FIND_DATA* data) {
  if (find.index >= find.result.matchCount || find.result.paths[find.index] == nullptr || data == nullptr) return 0;
  const std::string_view path = find.result.paths[find.index];
  struct stat64 status {};
  if (stat64(path.data(), &status) != 0) {
    vexa::debug_line("_fillFileData stat: %s", vexa::ErrorText(errno).c_str());
    return 0;
  }
  vexa::describe(status, *data);
  copy_name(path.substr(path.rfind('/') + 1), data->cFileName);  // npos + 1 is 0
  copy_name(kAlternateName, data->cAlternateFileName);
  return 1;
}

}  // namespace

typedHandle* FindFirstFile(const char* pattern, _WIN32_FIND_DATA* data) {
  std::unique_ptr<FindHandle> find(vexa::new_record<FindHandle>());
  if (find == nullptr) {
    vexa::debug_line("FindFirstFile new: %s", vexa::ErrorText(errno).c_str());
    return nullptr;
  }
  const int result = pathglob(pattern, 0, nullptr, &find->result);
  if (result != 0) {
    if (result != PATHGLOB_NOMATCH) vexa::debug_line("FindFirstFile pathglob: %s", vexa::ErrorText(errno).c_str());
    pathglobfree(&find->result);
    return nullptr;
  }
  fill(*find, data);
  return find.release();
}

int FindNextFile(typedHandle* h, _WIN32_FIND_DATA* data) {
  FindHandle* find = check_find_handle(h);
  if (find == nullptr) return 0;
  if (find->index < find->result.matchCount) ++find->index;
  return fill(*find, data);
}

int FindClose(typedHandle* h) {
  const std::unique_ptr<FindHandle> find(check_find_handle(h));
  if (find == nullptr) return 0;
  pathglobfree(&find->result);
  return 1;
}

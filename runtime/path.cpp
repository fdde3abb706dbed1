// SPDX-License-Identifier: Apache-2.0
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string_view>

#include "runtime/debug_output.h"
#include "vexa/runtime.h"

namespace {

constexpr std::size_t kPathLimit = 4095;  // characters _makepath writes at most

void copy_text(char* output, std::string_view text) {
  if (output == nullptr) return;
  std::copy(text.begin(), text.end(), output);
  output[text.size()] = '\0';
}

/// A path being joined from its pieces. After a piece that did not fit it takes no more.
class JoinedPath {
 public:
  explicit JoinedPath(char* path) : path_(path) { copy_text(path_, ""); }

  void add(std::string_view piece) {
    full_ = full_ || length_ + piece.size() > kPathLimit;
    if (full_) return;
    copy_text(path_ + length_, piece);
    length_ += piece.size();
  }

 private:
  char* path_;
  std::size_t length_ = 0;
  bool full_ = false;
};

std::string_view view_of(const char* text) { return text == nullptr ? std::string_view() : std::string_view(text); }

}  // namespace

unsigned long GetCurrentDirectory(unsigned long len, char* buf) {
  const std::unique_ptr<char, decltype(&std::free)> path(getcwd(nullptr, 0), &std::free);
  if (path == nullptr) {
    vexa::debug_line("GetCurrentDirectory getcwd: %s", vexa::ErrorText(errno).c_str());
    return 0;
  }
  const std::size_t length = std::strlen(path.get());
  if (length + 1 > len) return length + 1;
  copy_text(buf, path.get());
  return length;
}

void _makepath(char* path, const char* drive, const char* dir, const char* fname, const char* ext) {
  if (path == nullptr) return;
  JoinedPath joined(path);
  if (const auto letter = view_of(drive).substr(0, 1); !letter.empty()) {
    const char root[] = {letter[0], ':'};
    joined.add({root, sizeof root});
  }
  if (const auto folder = view_of(dir); !folder.empty()) {
    joined.add(folder);
    if (folder.back() != '/') joined.add("/");
  }
  joined.add(view_of(fname));
  if (const auto extension = view_of(ext); !extension.empty()) {
    if (extension.front() != '.') joined.add(".");
    joined.add(extension);
  }
}

// Kept: the pieces are copied whatever their length; hosts provide outputs as large as the whole path.
void _splitpath(const char* path, char* drive, char* dir, char* fname, char* ext) {
  const std::string_view whole = view_of(path);
  const std::string_view root = whole.substr(0, whole.size() >= 2 && whole[1] == ':' ? 2 : 0);
  const std::string_view rest = whole.substr(root.size());
  const std::string_view folder = rest.substr(0, rest.rfind('/') + 1);  // npos + 1 is 0
  const std::string_view file = rest.substr(folder.size());
  const std::size_t dot = std::min(file.rfind('.'), file.size());
  copy_text(drive, root);
  copy_text(dir, folder);
  copy_text(fname, file.substr(0, dot));
  copy_text(ext, file.substr(dot));
}

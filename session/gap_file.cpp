// SPDX-License-Identifier: Apache-2.0
#include "session/gap_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>

namespace vexa {
namespace {

constexpr std::size_t kLargest = std::size_t{64} << 20U;

bool write_at(int file, const std::string& text, long place) {
  for (std::size_t done = 0; done < text.size();) {
    const ssize_t count = pwrite(file, text.data() + done, text.size() - done, place + static_cast<long>(done));
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return false;
    done += static_cast<std::size_t>(count);
  }
  return true;
}

}  // namespace

GapFile::~GapFile() {
  if (file_ >= 0) close(file_);
}

std::string GapFile::read() {
  std::string text;
  if (path_.empty()) return text;
  const int file = open(path_.c_str(), O_RDONLY | O_CLOEXEC);
  if (file < 0) {
    unreadable_ = errno != ENOENT;
    return text;
  }
  char piece[8192];
  for (;;) {
    const ssize_t count = ::read(file, piece, sizeof piece);
    if (count < 0 && errno == EINTR) continue;
    unreadable_ = count < 0 || text.size() > kLargest;
    if (count <= 0 || unreadable_) break;
    text.append(piece, static_cast<std::size_t>(count));
  }
  close(file);
  return unreadable_ ? "" : text;
}

// A file that could not be read is not replaced.
void GapFile::begin(const std::string& first, const std::string& text) {
  if (path_.empty() || unreadable_) return;
  const std::string fresh = path_ + ".new";
  const int file = open(fresh.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
  if (file < 0) return;
  if (!write_at(file, first + text, 0) || std::rename(fresh.c_str(), path_.c_str()) != 0) {
    close(file);
    return;
  }
  if (file_ >= 0) close(file_);
  file_ = file;
  end_ = static_cast<long>(first.size() + text.size());
}

void GapFile::mark(const std::string& first) {
  if (file_ >= 0 && !write_at(file_, first, 0)) give_up();
}

void GapFile::append(const std::string& lines) {
  if (file_ < 0 || lines.empty()) return;
  if (!write_at(file_, lines, end_)) return give_up();
  end_ += static_cast<long>(lines.size());
}

void GapFile::give_up() {
  close(file_);
  file_ = -1;
}

}  // namespace vexa

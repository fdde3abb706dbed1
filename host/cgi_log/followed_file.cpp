// SPDX-License-Identifier: Apache-2.0
#include "host/cgi_log/followed_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

namespace vexa::host {

UniqueFd FollowedFile::open_by_name() const { return UniqueFd(::open(path_.c_str(), O_RDONLY | O_CLOEXEC)); }

std::optional<Problem> FollowedFile::open() {
  file_ = open_by_name();
  if (!file_.valid()) return unreadable(path_, errno);
  return std::nullopt;
}

bool FollowedFile::is_regular() const {
  struct stat status {};
  return fstat(file_.get(), &status) == 0 && S_ISREG(status.st_mode);
}

Result<std::size_t> FollowedFile::read(std::span<char> room) {
  const ssize_t count = read_some(file_.get(), room.data(), room.size());
  if (count < 0) return fail(unreadable(path_, errno));
  place_ += static_cast<off_t>(count);
  return static_cast<std::size_t>(count);
}

bool FollowedFile::begin_successor() {
  // In this order: once the name leads to another file, nobody appends to the former, whose length then is final.
  struct stat named {};
  const bool is_named = stat(path_.c_str(), &named) == 0;
  struct stat mine {};
  if (fstat(file_.get(), &mine) != 0 || mine.st_size > place_) return false;
  if (mine.st_size < place_) {
    place_ = 0;
    return lseek(file_.get(), 0, SEEK_SET) == 0;
  }
  const bool is_same = is_named && named.st_dev == mine.st_dev && named.st_ino == mine.st_ino;
  if (!is_named || is_same) return false;
  UniqueFd successor = open_by_name();
  if (!successor.valid()) return false;
  file_ = std::move(successor);
  place_ = 0;
  return true;
}

}  // namespace vexa::host

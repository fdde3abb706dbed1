// SPDX-License-Identifier: Apache-2.0
// A file that grows while it is read.
#ifndef HOST_CGI_LOG_FOLLOWED_FILE_H_
#define HOST_CGI_LOG_FOLLOWED_FILE_H_

#include <sys/types.h>

#include <optional>
#include <span>
#include <string>

#include "host/base/problem.h"
#include "host/base/unique_fd.h"

namespace vexa::host {

// Reads a log that another process is writing. Owned by one command and used on its thread; never writes and never
// waits: the caller pauses between two reads.
class FollowedFile {
 public:
  explicit FollowedFile(std::string path) : path_(std::move(path)) {}

  [[nodiscard]] std::optional<Problem> open();
  [[nodiscard]] bool is_regular() const;
  // The number of bytes read; 0 at the present end.
  [[nodiscard]] Result<std::size_t> read(std::span<char> room);
  // At the end: whether the name now leads to another file, or this one has been emptied. Reading then goes on at the
  // beginning.
  [[nodiscard]] bool begin_successor();

 private:
  [[nodiscard]] UniqueFd open_by_name() const;

  const std::string path_;
  UniqueFd file_;
  off_t place_ = 0;
};

}  // namespace vexa::host

#endif  // HOST_CGI_LOG_FOLLOWED_FILE_H_

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

// Owns the descriptor of the file that it reads. One thread: the one that prints the log.
class FollowedFile {
 public:
  explicit FollowedFile(std::string path) : path_(std::move(path)) {}

  [[nodiscard]] std::optional<Problem> open();
  [[nodiscard]] bool is_regular() const;
  // How many bytes were read; 0 at the end, as it is now.
  [[nodiscard]] Result<std::size_t> read(std::span<char> room);
  // At the end: whether there is another file of that name by now, or this one has been emptied. Reading goes on at
  // its beginning then.
  [[nodiscard]] bool begin_successor();

 private:
  [[nodiscard]] UniqueFd open_by_name() const;

  const std::string path_;
  UniqueFd file_;
  off_t place_ = 0;
};

}  // namespace vexa::host

#endif  // HOST_CGI_LOG_FOLLOWED_FILE_H_

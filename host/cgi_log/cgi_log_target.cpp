#include "host/cgi_log/cgi_log_target.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>

#include <cerrno>
#include <system_error>

#include "host/base/unique_fd.h"

namespace vexa::host {
namespace {

// The driver would cut a longer name, and write to another file.
constexpr std::size_t kLongestPath = 1023;

Problem unwritable(const std::string& path, const std::string& why) {
  return {ExitCode::kCannotWrite, fmt::format("cannot write {}: {}", path, why),
          "Give --cgi-log a file in a folder that exists and that you may write to."};
}

}  // namespace

std::optional<Problem> check_cgi_log_target(const std::string& path) {
  if (path.empty()) return Problem{ExitCode::kUsage, "--cgi-log names no file", "For instance: --cgi-log cgi.log."};
  if (path.size() > kLongestPath) {
    return Problem{ExitCode::kUsage, fmt::format("the name of --cgi-log is longer than {} characters", kLongestPath),
                   "Choose a shorter one."};
  }
  // Opening a pipe without a reader must not wait for one.
  const UniqueFd file(open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_NONBLOCK | O_CLOEXEC, 0666));
  if (!file.valid()) return unwritable(path, std::generic_category().message(errno));
  struct stat status {};
  if (fstat(file.get(), &status) != 0) return unwritable(path, std::generic_category().message(errno));
  if (!S_ISREG(status.st_mode)) return unwritable(path, "not a regular file");
  return std::nullopt;
}

}  // namespace vexa::host

// SPDX-License-Identifier: Apache-2.0
#include "host/recording/frame_file.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

#include "host/base/unique_fd.h"

namespace vexa::host {
namespace {

std::string folder_of(const std::string& path) {
  const std::size_t slash = path.rfind('/');
  if (slash == std::string::npos) return ".";
  return slash == 0 ? "/" : path.substr(0, slash);
}

// 0, or the error that writing there would meet.
int access_error(const std::string& path, int mode) {
  return faccessat(AT_FDCWD, path.c_str(), mode, AT_EACCESS) == 0 ? 0 : errno;
}

int error_of_writing(const std::string& path) {
  struct stat status {};
  if (stat(path.c_str(), &status) == 0) return S_ISDIR(status.st_mode) ? EISDIR : access_error(path, W_OK);
  if (errno != ENOENT) return errno;
  return access_error(folder_of(path), W_OK | X_OK);
}

}  // namespace

Problem FrameFile::problem(int error) const {
  return {ExitCode::kCannotWrite, fmt::format("cannot write {}: {}", path_, std::generic_category().message(error)),
          "Give --out a file in a folder that exists, that you may write to, and that has room."};
}

std::optional<Problem> FrameFile::check() const {
  if (given_fd_ >= 0) return std::nullopt;
  const int error = error_of_writing(path_);
  if (error != 0) return problem(error);
  return std::nullopt;
}

std::optional<Problem> FrameFile::write(const unsigned char* data, std::size_t length) {
  if (given_fd_ < 0 && !file_.valid()) {
    file_ = UniqueFd(open(path_.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666));
    if (!file_.valid()) return problem(errno);
  }
  const int error = write_all(given_fd_ >= 0 ? given_fd_ : file_.get(), data, length);
  if (error != 0) return problem(error);
  return std::nullopt;
}

std::optional<Problem> FrameFile::overwrite(std::size_t at, const unsigned char* data, std::size_t length) {
  while (length > 0) {
    const ssize_t written = pwrite(file_.get(), data, length, static_cast<off_t>(at));
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) return problem(written < 0 ? errno : ENOSPC);
    data += written;
    at += static_cast<std::size_t>(written);
    length -= static_cast<std::size_t>(written);
  }
  return std::nullopt;
}

std::optional<Problem> FrameFile::close() {
  if (!file_.reset()) return problem(errno);
  return std::nullopt;
}

std::optional<Problem> write_whole_file(FrameFile&& file, const std::vector<std::uint8_t>& bytes) {
  if (auto problem = file.write(bytes.data(), bytes.size())) return problem;
  return file.close();
}

}  // namespace vexa::host

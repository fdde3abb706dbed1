// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <memory>
#include <optional>

#include "runtime/debug_output.h"
#include "runtime/file_status.h"
#include "runtime/handle.h"
#include "vexa/runtime.h"

namespace {

constexpr mode_t kFileMode = 0644;
constexpr mode_t kDirectoryMode = 0755;

using vexa::check_file_handle;
using vexa::debug_line;
using vexa::ErrorText;
using vexa::FileHandle;

/// A null path counts as the empty one, which names no file.
const char* or_empty(const char* path) { return path == nullptr ? "" : path; }

/// A function's result: 1 when `result` is 0; else 0, and a line that reports `what` failed on `path`.
int done_or_reported(int result, const char* what, const char* path) {
  if (result == 0) return 1;
  debug_line("%s %s: %s", what, path, ErrorText(errno).c_str());
  return 0;
}

std::optional<int> access_flags(unsigned long access) {
  switch (access) {
    case GENERIC_READ:
      return O_RDONLY;
    case GENERIC_WRITE:
      return O_WRONLY;
    case GENERIC_READ | GENERIC_WRITE:
      return O_RDWR;
    default:
      return std::nullopt;
  }
}

std::optional<int> creation_flags(unsigned long creation) {
  switch (creation) {
    case CREATE_ALWAYS:
      return O_CREAT | O_TRUNC;
    case CREATE_NEW:
      return O_CREAT | O_EXCL;
    case OPEN_ALWAYS:
      return O_CREAT;
    case OPEN_EXISTING:
      return 0;
    case TRUNCATE_EXISTING:
      return O_TRUNC;
    default:
      return std::nullopt;
  }
}

/// Stores the result of a system call that moved bytes. A null `moved` is skipped.
void store(unsigned long* moved, ssize_t result) {
  if (moved != nullptr) *moved = static_cast<std::uint32_t>(result);
}

}  // namespace

int GetDiskFreeSpaceEx(const char* path, ULARGE_INTEGER* freeToCaller, ULARGE_INTEGER* total,
                       ULARGE_INTEGER* totalFree) {
  if (path == nullptr) path = ".";
  struct statvfs64 system {};
  const auto space = statvfs64(path, &system) == 0 ? vexa::space_of(system) : std::nullopt;
  if (!space) {
    const int error = errno;
    debug_line("GetDiskFreeSpaceEx statfs %s: %s", path, ErrorText(error).c_str());
    errno = error;
    return 0;
  }
  if (freeToCaller != nullptr) *freeToCaller = space->available;
  if (total != nullptr) *total = space->total;
  if (totalFree != nullptr) *totalFree = space->free;
  return 1;
}

std::uint32_t GetFileAttributes(const char* path) {
  struct stat64 status {};
  if (stat64(or_empty(path), &status) == 0) return vexa::attributes_of(status);
  if (errno != ENOENT) debug_line("GetFileAttributes stat %s: %s", or_empty(path), ErrorText(errno).c_str());
  return INVALID_FILE_ATTRIBUTES;
}

int GetFileAttributesEx(const char* path, _GET_FILEEX_INFO_LEVELS level, void* data) {
  if (level != GetFileExInfoStandard) {
    debug_line("GetFileAttributesEx : only level GetFileExInfoStandard is supported");
    return 0;
  }
  struct stat64 status {};
  if (done_or_reported(stat64(or_empty(path), &status), "GetFileAttributesEx stat", or_empty(path)) == 0) return 0;
  if (data == nullptr) return 0;
  vexa::describe(status, *static_cast<WIN32_FILE_ATTRIBUTE_DATA*>(data));
  return 1;
}

int RemoveDirectory(const char* path) {
  return done_or_reported(rmdir(or_empty(path)), "RemoveDirectory rmdir", or_empty(path));
}

int CreateDirectory(const char* path, _SECURITY_ATTRIBUTES* sa) {
  if (sa != nullptr) {
    debug_line("CreateDirectory : no support for security attributes yet");
    return 0;
  }
  return done_or_reported(mkdir(or_empty(path), kDirectoryMode), "CreateDirectory mkdir", or_empty(path));
}

int MoveFile(const char* from, const char* to) {
  if (std::rename(or_empty(from), or_empty(to)) == 0) return 1;
  debug_line("MoveFile rename %s to %s: %s", or_empty(from), or_empty(to), ErrorText(errno).c_str());
  return 0;
}

int DeleteFile(const char* path) {
  return done_or_reported(unlink(or_empty(path)), "DeleteFile unlink", or_empty(path));
}

typedHandle* CreateFile(const char* path, unsigned long access, unsigned long, _SECURITY_ATTRIBUTES*,
                        unsigned long creation, unsigned long, typedHandle*) {
  const std::optional<int> mode = access_flags(access);
  const std::optional<int> disposition = creation_flags(creation);
  if (!mode || !disposition) return nullptr;
  std::unique_ptr<FileHandle> file(vexa::new_record<FileHandle>());
  if (file == nullptr) {
    debug_line("CreateFile new: %s", ErrorText(errno).c_str());
    return nullptr;
  }
  file->fd = open64(or_empty(path), *mode | *disposition | O_CLOEXEC, kFileMode);
  if (file->fd == -1) {
    debug_line("CreateFile fopen %s: %s", or_empty(path), ErrorText(errno).c_str());
    return nullptr;
  }
  return file.release();
}

std::uint32_t GetFileSize(typedHandle* h, unsigned long* high) {
  const FileHandle* file = check_file_handle(h);
  if (file == nullptr) return INVALID_FILE_SIZE;
  struct stat64 status {};
  if (fstat64(file->fd, &status) != 0) {
    debug_line("GetFileSize fstat: %s", ErrorText(errno).c_str());
    return INVALID_FILE_SIZE;
  }
  // Kept: the size is cut to its low half; the high half is always reported as 0.
  if (high != nullptr) *high = 0;
  return static_cast<std::uint32_t>(status.st_size);
}

std::uint32_t SetFilePointer(typedHandle* h, long offset, long* high, unsigned long method) {
  const FileHandle* file = check_file_handle(h);
  if (file == nullptr) return INVALID_SET_FILE_POINTER;
  if (high != nullptr) {
    debug_line("SetFilePointer : no support for 64 bit positions");
    return INVALID_SET_FILE_POINTER;
  }
  const off64_t position = lseek64(file->fd, offset, static_cast<int>(method));
  if (position == -1) {
    debug_line("SetFilePointer fseek: %s", ErrorText(errno).c_str());
    return INVALID_SET_FILE_POINTER;
  }
  return static_cast<std::uint32_t>(position);
}

int FlushFileBuffers(typedHandle* h) {
  const FileHandle* file = check_file_handle(h);
  if (file == nullptr) return 0;
  if (fsync(file->fd) == 0) return 1;
  debug_line("FlushFileBuffers fflush: %s", ErrorText(errno).c_str());
  return 0;
}

// Kept: a write that failed is a success with 0xFFFFFFFF bytes; the caller compares the count.
int WriteFile(typedHandle* h, const void* buf, unsigned long len, unsigned long* written, _OVERLAPPED* ov) {
  const FileHandle* file = check_file_handle(h);
  if (file == nullptr) return 0;
  store(written, 0);
  if (ov != nullptr) {
    debug_line("WriteFile : no support for overlapped write yet");
    return 0;
  }
  store(written, write(file->fd, buf, len));
  return 1;
}

// Kept: a read that failed is a success with 0xFFFFFFFF bytes; the caller compares the count.
int ReadFile(typedHandle* h, void* buf, unsigned long len, unsigned long* read, _OVERLAPPED* ov) {
  const FileHandle* file = check_file_handle(h);
  if (file == nullptr) return 0;
  store(read, 0);
  if (ov != nullptr) {
    debug_line("ReadFile : no support for overlapped read yet");
    return 0;
  }
  store(read, ::read(file->fd, buf, len));
  return 1;
}

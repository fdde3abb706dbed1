// SPDX-License-Identifier: Apache-2.0
// What the system reports about a file, in the values of this layer.
#pragma once

#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <cstdint>
#include <optional>

#include "runtime/file_time.h"
#include "vexa/runtime.h"

namespace vexa {

/// FILE_ATTRIBUTE_... for the calling process.
// Kept: one write bit decides, the owner's, the group's or the others'. Further groups, access lists and what a
// superuser may do besides are not considered.
inline std::uint32_t attributes_of(const struct stat64& status) {
  const mode_t others_or_group = status.st_gid == getegid() ? S_IWGRP : S_IWOTH;
  const mode_t write_bit = status.st_uid == geteuid() ? S_IWUSR : others_or_group;
  const bool writable = (status.st_mode & write_bit) != 0;
  if (S_ISDIR(status.st_mode)) return FILE_ATTRIBUTE_DIRECTORY | (writable ? 0 : FILE_ATTRIBUTE_READONLY);
  return writable ? FILE_ATTRIBUTE_NORMAL : FILE_ATTRIBUTE_READONLY;
}

/// Whole seconds since 1970 as a FILETIME.
inline _FILETIME file_time_of_unix(std::int64_t seconds) {
  return file_time_of(static_cast<std::uint64_t>(seconds + kUnixEpochSeconds) * kTicksPerSecond);
}

/// Fills the fields that WIN32_FILE_ATTRIBUTE_DATA and _WIN32_FIND_DATA share.
template <typename Data>
void describe(const struct stat64& status, Data& data) {
  data.dwFileAttributes = attributes_of(status);
  data.ftCreationTime = {};
  data.ftLastAccessTime = file_time_of_unix(status.st_atime);
  data.ftLastWriteTime = file_time_of_unix(status.st_mtime);
  data.nFileSizeHigh = 0;
  data.nFileSizeLow = static_cast<std::uint32_t>(status.st_size);
}

/// `blocks` of a file system in bytes.
inline ULARGE_INTEGER bytes_of(const struct statvfs64& system, std::uint64_t blocks) {
  ULARGE_INTEGER bytes;
  bytes.QuadPart = blocks * system.f_frsize;
  return bytes;
}

/// What a file system has room for, in bytes.
struct DiskSpace {
  ULARGE_INTEGER available;  ///< to the calling user
  ULARGE_INTEGER total;
  ULARGE_INTEGER free;
};

/// Nullopt when the system reports no block size.
inline std::optional<DiskSpace> space_of(const struct statvfs64& system) {
  if (system.f_frsize == 0) return std::nullopt;
  return DiskSpace{bytes_of(system, system.f_bavail), bytes_of(system, system.f_blocks),
                   bytes_of(system, system.f_bfree)};
}

}  // namespace vexa

// SPDX-License-Identifier: Apache-2.0
#include "node/segments/disk_calls.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>

namespace vexa::node {

int DiskCalls::sync_data(int file) { return fdatasync(file) == 0 ? 0 : errno; }

int DiskCalls::sync(int file_or_folder) { return fsync(file_or_folder) == 0 ? 0 : errno; }

int DiskCalls::rename(int folder, const char* from, const char* to) {
  return renameat(folder, from, folder, to) == 0 ? 0 : errno;
}

}  // namespace vexa::node

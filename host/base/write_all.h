#ifndef HOST_BASE_WRITE_ALL_H_
#define HOST_BASE_WRITE_ALL_H_

#include <cstddef>

namespace vexa::host {

// Writes every byte, across partial writes and signals. Returns 0, or the error's number.
[[nodiscard]] int write_all(int fd, const void* data, std::size_t length);

}  // namespace vexa::host

#endif  // HOST_BASE_WRITE_ALL_H_

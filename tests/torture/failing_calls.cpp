// SPDX-License-Identifier: Apache-2.0
// The library that is loaded before all others: its functions take the place of the system's, count calls and make the
// chosen one fail. Nothing here allocates.
#include <dlfcn.h>
#include <fcntl.h>
#include <netdb.h>
#include <poll.h>
#include <pthread.h>
#include <sys/epoll.h>
#include <sys/socket.h>
#include <sys/timerfd.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "tests/torture/fault_control.h"

using vexa::torture::Fault;
using vexa::torture::Function;
using vexa::torture::Kind;

namespace {

std::atomic<bool> armed{false};
Fault fault{};  // written while not armed
std::atomic<std::uint64_t> calls{0};

bool fails(Function function) {
  if (!armed.load(std::memory_order_acquire) || function != fault.function) return false;
  const std::uint64_t call = ++calls;
  return fault.at != 0 && (call == fault.at || (fault.forever != 0 && call > fault.at));
}

int failure() {
  errno = fault.error;
  return -1;
}

// The system's own function of this name; of the C library, as nothing else defines it.
template <typename F>
F* real(const char* name, std::atomic<void*>& cache) {
  void* found = cache.load(std::memory_order_relaxed);
  if (found == nullptr) {
    found = dlsym(RTLD_NEXT, name);
    if (found == nullptr) std::abort();
    cache.store(found, std::memory_order_relaxed);
  }
  return reinterpret_cast<F*>(found);
}

// Bytes of a transfer that is to end short.
std::size_t cut(std::size_t length) { return std::min<std::size_t>(length, 1); }

}  // namespace

#define REAL(name)                             \
  ([]() {                                      \
    static std::atomic<void*> cache{nullptr};  \
    return real<decltype(name)>(#name, cache); \
  }())

extern "C" {

void vexa_torture_arm(const Fault* chosen) {
  armed.store(false, std::memory_order_release);
  fault = *chosen;
  calls = 0;
  armed.store(true, std::memory_order_release);
}

std::uint64_t vexa_torture_disarm() {
  armed.store(false, std::memory_order_release);
  return calls;
}

void* __libc_malloc(std::size_t size);
void* __libc_calloc(std::size_t count, std::size_t size);
void* __libc_realloc(void* block, std::size_t size);

void* malloc(std::size_t size) {
  if (!fails(Function::kAllocate)) return __libc_malloc(size);
  errno = ENOMEM;
  return nullptr;
}

void* calloc(std::size_t count, std::size_t size) {
  if (!fails(Function::kAllocate)) return __libc_calloc(count, size);
  errno = ENOMEM;
  return nullptr;
}

void* realloc(void* block, std::size_t size) {
  if (!fails(Function::kAllocate)) return __libc_realloc(block, size);
  errno = ENOMEM;
  return nullptr;
}

int socket(int domain, int type, int protocol) {
  return fails(Function::kSocket) ? failure() : REAL(socket)(domain, type, protocol);
}

int connect(int fd, const sockaddr* address, socklen_t length) {
  return fails(Function::kConnect) ? failure() : REAL(connect)(fd, address, length);
}

int bind(int fd, const sockaddr* address, socklen_t length) {
  return fails(Function::kBind) ? failure() : REAL(bind)(fd, address, length);
}

int setsockopt(int fd, int level, int option, const void* value, socklen_t length) {
  return fails(Function::kSetsockopt) ? failure() : REAL(setsockopt)(fd, level, option, value, length);
}

int fcntl(int fd, int command, ...) {
  va_list arguments;
  va_start(arguments, command);
  void* const argument = va_arg(arguments, void*);
  va_end(arguments);
  return fails(Function::kFcntl) ? failure() : REAL(fcntl)(fd, command, argument);
}

int fcntl64(int fd, int command, ...) {
  va_list arguments;
  va_start(arguments, command);
  void* const argument = va_arg(arguments, void*);
  va_end(arguments);
  return fails(Function::kFcntl) ? failure() : REAL(fcntl64)(fd, command, argument);
}

int poll(pollfd* fds, nfds_t count, int timeout) {
  return fails(Function::kPoll) ? failure() : REAL(poll)(fds, count, timeout);
}

int __poll_chk(pollfd* fds, nfds_t count, int timeout, std::size_t) { return poll(fds, count, timeout); }

int ppoll(pollfd* fds, nfds_t count, const timespec* timeout, const sigset_t* mask) {
  return fails(Function::kPoll) ? failure() : REAL(ppoll)(fds, count, timeout, mask);
}

ssize_t send(int fd, const void* data, std::size_t length, int flags) {
  if (!fails(Function::kSend)) return REAL(send)(fd, data, length, flags);
  return fault.kind == Kind::kShort ? REAL(send)(fd, data, cut(length), flags) : failure();
}

ssize_t sendto(int fd, const void* data, std::size_t length, int flags, const sockaddr* to, socklen_t size) {
  if (!fails(Function::kSend)) return REAL(sendto)(fd, data, length, flags, to, size);
  return fault.kind == Kind::kShort ? REAL(sendto)(fd, data, cut(length), flags, to, size) : failure();
}

ssize_t recv(int fd, void* data, std::size_t length, int flags) {
  if (!fails(Function::kReceive)) return REAL(recv)(fd, data, length, flags);
  return fault.kind == Kind::kShort ? REAL(recv)(fd, data, cut(length), flags) : failure();
}

ssize_t __recv_chk(int fd, void* data, std::size_t length, std::size_t, int flags) {
  return recv(fd, data, length, flags);
}

ssize_t recvfrom(int fd, void* data, std::size_t length, int flags, sockaddr* from, socklen_t* size) {
  if (!fails(Function::kReceive)) return REAL(recvfrom)(fd, data, length, flags, from, size);
  return fault.kind == Kind::kShort ? REAL(recvfrom)(fd, data, cut(length), flags, from, size) : failure();
}

ssize_t __recvfrom_chk(int fd, void* data, std::size_t length, std::size_t, int flags, sockaddr* from,
                       socklen_t* size) {
  return recvfrom(fd, data, length, flags, from, size);
}

ssize_t recvmsg(int fd, msghdr* message, int flags) {
  return fails(Function::kReceive) ? failure() : REAL(recvmsg)(fd, message, flags);
}

int recvmmsg(int fd, mmsghdr* messages, unsigned count, int flags, timespec* timeout) {
  if (!fails(Function::kReceive)) return REAL(recvmmsg)(fd, messages, count, flags, timeout);
  return fault.kind == Kind::kShort ? REAL(recvmmsg)(fd, messages, 1, flags, timeout) : failure();
}

int pipe2(int fds[2], int flags) { return fails(Function::kPipe) ? failure() : REAL(pipe2)(fds, flags); }

int eventfd(unsigned count, int flags);
int eventfd(unsigned count, int flags) { return fails(Function::kEventfd) ? failure() : REAL(eventfd)(count, flags); }

int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*start)(void*), void* argument) {
  return fails(Function::kThread) ? EAGAIN : REAL(pthread_create)(thread, attributes, start, argument);
}

int open(const char* path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
  va_end(arguments);
  return fails(Function::kOpen) ? failure() : REAL(open)(path, flags, mode);
}

int open64(const char* path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
  va_end(arguments);
  return fails(Function::kOpen) ? failure() : REAL(open64)(path, flags, mode);
}

int __open_2(const char* path, int flags) { return open(path, flags); }
int __open64_2(const char* path, int flags) { return open64(path, flags); }

ssize_t read(int fd, void* data, std::size_t length) {
  if (!fails(Function::kRead)) return REAL(read)(fd, data, length);
  return fault.kind == Kind::kShort ? REAL(read)(fd, data, cut(length)) : failure();
}

ssize_t __read_chk(int fd, void* data, std::size_t length, std::size_t) { return read(fd, data, length); }

ssize_t write(int fd, const void* data, std::size_t length) {
  if (!fails(Function::kWrite)) return REAL(write)(fd, data, length);
  return fault.kind == Kind::kShort ? REAL(write)(fd, data, cut(length)) : failure();
}

int rename(const char* from, const char* to) { return fails(Function::kRename) ? failure() : REAL(rename)(from, to); }

int fsync(int fd) { return fails(Function::kSync) ? failure() : REAL(fsync)(fd); }

int gethostbyname_r(const char* name, hostent* host, char* buffer, std::size_t length, hostent** result, int* error) {
  if (!fails(Function::kResolve)) return REAL(gethostbyname_r)(name, host, buffer, length, result, error);
  *result = nullptr;
  *error = fault.error;
  return EAGAIN;
}

int epoll_create1(int flags) { return fails(Function::kEpoll) ? failure() : REAL(epoll_create1)(flags); }

int epoll_ctl(int set, int operation, int fd, epoll_event* event) {
  return fails(Function::kEpollAdd) ? failure() : REAL(epoll_ctl)(set, operation, fd, event);
}

int timerfd_create(clockid_t clock, int flags) {
  return fails(Function::kTimer) ? failure() : REAL(timerfd_create)(clock, flags);
}

int getsockname(int fd, sockaddr* address, socklen_t* length) {
  return fails(Function::kSocketName) ? failure() : REAL(getsockname)(fd, address, length);
}

int getsockopt(int fd, int level, int option, void* value, socklen_t* length) {
  return fails(Function::kSocketOption) ? failure() : REAL(getsockopt)(fd, level, option, value, length);
}

int pthread_mutex_init(pthread_mutex_t* mutex, const pthread_mutexattr_t* attributes) {
  return fails(Function::kMutex) ? EAGAIN : REAL(pthread_mutex_init)(mutex, attributes);
}

}  // extern "C"

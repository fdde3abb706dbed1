// Threads whose exit code can be polled. One lock guards the thread map and the state of every thread handle.
#include <limits.h>
#include <pthread.h>

#include <cstddef>
#include <map>
#include <memory>
#include <new>
#include <utility>

#include "runtime/base/result.h"
#include "runtime/handle.h"

namespace {

using ThreadHandle = _windowsThreadHandle;
using ThreadMap = std::map<unsigned long, ThreadHandle*>;

constexpr std::size_t kDefaultStackSize = 0x80000;

// Recursive, usable before any constructor has run and after every destructor has.
class VEXA_LOCK ThreadLock {
 public:
  void lock() VEXA_ACQUIRE() { pthread_mutex_lock(&mutex_); }
  void unlock() VEXA_RELEASE() { pthread_mutex_unlock(&mutex_); }

 private:
  pthread_mutex_t mutex_ = PTHREAD_RECURSIVE_MUTEX_INITIALIZER_NP;
};

constinit ThreadLock thread_lock;

class VEXA_THREAD_ATTRIBUTE(scoped_lockable) Hold {
 public:
  Hold() VEXA_ACQUIRE(thread_lock) { thread_lock.lock(); }
  ~Hold() VEXA_RELEASE() { thread_lock.unlock(); }
  Hold(const Hold&) = delete;
  Hold& operator=(const Hold&) = delete;
};

// Safe: the map is never destroyed, so that a thread that ends, or is polled, while the process exits still finds it.
union Undestroyed {
  ThreadMap map;
  Undestroyed() : map() {}
  ~Undestroyed() {}
};

ThreadMap& threads() VEXA_REQUIRES(thread_lock) {
  static Undestroyed storage;
  return storage.map;
}

// A map entry made ahead, so that entering a thread that runs already cannot fail. Empty when memory is short.
ThreadMap::node_type entry_for(ThreadHandle* handle) {
  ThreadMap::node_type entry;
  const bool fitted = vexa::within_memory([&] {
    ThreadMap single;
    single.emplace(0, handle);
    entry = single.extract(single.begin());
  });
  return fitted ? std::move(entry) : ThreadMap::node_type();
}

// The calling thread's handle; null for a thread of other making.
ThreadHandle* handle_of_caller() VEXA_REQUIRES(thread_lock) {
  try {
    // Kept: a thread of other making gets an entry with a null handle, which stays until its identifier is used again.
    return threads()[pthread_self()];
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

void remove_thread(ThreadHandle* handle) {
  const Hold hold;
  threads().erase(handle->id);
  delete handle;
}

struct StartBlock {
  void* argument;
  unsigned int (*routine)(void*);
};

bool create_thread(pthread_t& id, std::size_t stack_size, StartBlock* block) {
  const auto least = static_cast<std::size_t>(PTHREAD_STACK_MIN);
  pthread_attr_t attributes;
  if (pthread_attr_init(&attributes) != 0) return false;
  pthread_attr_setstacksize(&attributes, stack_size < least ? kDefaultStackSize : stack_size);
  const bool created = pthread_create(&id, &attributes, thread_func_internal, block) == 0;
  pthread_attr_destroy(&attributes);
  return created;
}

}  // namespace

bool threadId(typedHandle* h, unsigned long& id) {
  const auto* handle = vexa::record_of<ThreadHandle>(h);
  if (handle == nullptr) return false;
  const Hold hold;
  if (handle->closed) return false;
  id = handle->id;
  return true;
}

typedHandle* _beginthreadex(void* security, unsigned int stackSize, unsigned int (*start)(void*), void* arg,
                            unsigned int /*initFlag*/, unsigned int* threadIdOut) {
  if (security != nullptr || start == nullptr) return nullptr;
  std::unique_ptr<ThreadHandle> handle(vexa::new_record<ThreadHandle>());
  std::unique_ptr<StartBlock> block(new (std::nothrow) StartBlock{arg, start});
  ThreadMap::node_type entry = entry_for(handle.get());
  if (handle == nullptr || block == nullptr || entry.empty()) return nullptr;

  // Held from before the thread begins until it is entered, so that one that ends at once keeps its exit code.
  const Hold hold;
  if (!create_thread(handle->id, stackSize, block.get())) return nullptr;
  static_cast<void>(block.release());  // the thread frees it
  entry.key() = handle->id;
  threads().erase(handle->id);
  threads().insert(std::move(entry));
  if (threadIdOut != nullptr) *threadIdOut = static_cast<unsigned int>(handle->id);
  return handle.release();
}

void* thread_func_internal(void* startBlock) {
  auto* block = static_cast<StartBlock*>(startBlock);
  if (block == nullptr) return nullptr;
  const StartBlock start = *block;
  delete block;
  cleanup_thread_internal(start.routine(start.argument));
  return nullptr;
}

void _endthreadex(unsigned int code) {
  cleanup_thread_internal(code);
  pthread_exit(nullptr);
}

void cleanup_thread_internal(unsigned int code) {
  const Hold hold;
  ThreadHandle* handle = handle_of_caller();
  if (handle == nullptr) return;
  handle->exit_code = code;
  handle->finished = true;
  if (!handle->closed) return;
  pthread_detach(pthread_self());
  remove_thread(handle);
}

int GetExitCodeThread(typedHandle* h, unsigned long* code) {
  const auto* handle = vexa::record_of<ThreadHandle>(h);
  if (handle == nullptr || code == nullptr) return 0;
  const Hold hold;
  if (handle->closed) return 0;
  // Kept: a routine whose result is 259 looks as if it were still running; the number means that to every host.
  *code = handle->exit_code;
  return 1;
}

int CloseThreadHandle(typedHandle* h) {
  auto* handle = vexa::record_of<ThreadHandle>(h);
  if (handle == nullptr) return 0;
  {
    const Hold hold;
    if (handle->closed) return 0;
    handle->closed = true;
    // Safe: `finished` decides, not the exit code, so a thread that ended with 259 is joined and freed like any other.
    if (!handle->finished) return 1;
    threads().erase(handle->id);
  }
  // Safe: joined without the lock, which the ending thread's own clean-up (a host's thread-local objects) may need. A
  // thread that closes itself cannot be joined and is left to end alone.
  if (pthread_equal(handle->id, pthread_self()) != 0) {
    pthread_detach(handle->id);
  } else {
    pthread_join(handle->id, nullptr);
  }
  delete handle;
  return 1;
}

// SPDX-License-Identifier: Apache-2.0
#include "tests/support/failing_new.h"

#include <cstddef>
#include <cstdlib>
#include <new>

namespace {

constexpr int kOff = -1;
constexpr int kHappened = -2;

thread_local int allocations_left = kOff;
thread_local int allocations_made = 0;

void* allocate(std::size_t size) noexcept {
  ++allocations_made;
  if (allocations_left == 0) {
    allocations_left = kHappened;
    return nullptr;
  }
  if (allocations_left > 0) --allocations_left;
  return std::malloc(size > 0 ? size : 1);
}

void* allocate_or_throw(std::size_t size) {
  void* block = allocate(size);
  if (block == nullptr) throw std::bad_alloc();
  return block;
}

}  // namespace

void* operator new(std::size_t size) { return allocate_or_throw(size); }
void* operator new[](std::size_t size) { return allocate_or_throw(size); }
void* operator new(std::size_t size, const std::nothrow_t&) noexcept { return allocate(size); }
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept { return allocate(size); }
void operator delete(void* block) noexcept { std::free(block); }
void operator delete[](void* block) noexcept { std::free(block); }
// Clang declares these nowhere, and would hide them from the C++ library.
#pragma GCC visibility push(default)
void operator delete(void* block, std::size_t) noexcept { std::free(block); }
void operator delete[](void* block, std::size_t) noexcept { std::free(block); }
#pragma GCC visibility pop
void operator delete(void* block, const std::nothrow_t&) noexcept { std::free(block); }
void operator delete[](void* block, const std::nothrow_t&) noexcept { std::free(block); }

namespace vexa_test {

AllocationFailure::AllocationFailure(int nth) { allocations_left = nth; }

AllocationFailure::~AllocationFailure() { allocations_left = kOff; }

AllocationCount::AllocationCount() : before_(allocations_made) {}

int AllocationCount::so_far() const { return allocations_made - before_; }

bool AllocationFailure::happened() const { return allocations_left == kHappened; }

}  // namespace vexa_test

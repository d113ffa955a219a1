#include "tests/campaign/AllocationFailures.h"

#include <cstdlib>
#include <limits>
#include <new>

namespace accounts {

namespace {

constexpr std::size_t kNever = std::numeric_limits<std::size_t>::max();

// Allocations have no other way to find these. The program has one thread.
struct {
  bool isCounting = false;
  int pauses = 0;
  std::size_t count = 0;
  std::size_t failing = kNever;
} failures;

void* allocate(std::size_t size) {
  if (failures.isCounting && failures.pauses == 0 && failures.count++ == failures.failing) {
    throw std::bad_alloc();
  }
  void* memory = std::malloc(size != 0 ? size : 1);
  if (memory == nullptr) {
    throw std::bad_alloc();
  }
  return memory;
}

}  // namespace

AllocationFailure::AllocationFailure(std::optional<std::size_t> number) {
  failures.count = 0;
  failures.failing = number.value_or(kNever);
  failures.isCounting = true;
}

AllocationFailure::~AllocationFailure() {
  failures.isCounting = false;
}

std::size_t AllocationFailure::count() {
  return failures.count;
}

AllocationsSucceed::AllocationsSucceed() {
  ++failures.pauses;
}

AllocationsSucceed::~AllocationsSucceed() {
  --failures.pauses;
}

}  // namespace accounts

// Every form that the program uses, since the sanitizers' forms do not come to one another. Nothing
// here asks for more than the default alignment.
void* operator new(std::size_t size) {
  return accounts::allocate(size);
}

void* operator new[](std::size_t size) {
  return accounts::allocate(size);
}

void* operator new(std::size_t size, const std::nothrow_t& /*nothrow*/) noexcept {
  try {
    return accounts::allocate(size);
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

void operator delete(void* memory) noexcept {
  std::free(memory);
}

void operator delete(void* memory, std::size_t /*size*/) noexcept {
  std::free(memory);
}

void operator delete[](void* memory) noexcept {
  std::free(memory);
}

void operator delete[](void* memory, std::size_t /*size*/) noexcept {
  std::free(memory);
}

void operator delete(void* memory, const std::nothrow_t& /*nothrow*/) noexcept {
  std::free(memory);
}

#include "commandline/MemoryReserve.h"

#include <unistd.h>

#include <array>
#include <cstdlib>
#include <exception>
#include <memory>
#include <new>
#include <string_view>

#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

constexpr const char* kOutOfMemory = "No memory";
/// What a commit and telling of it take, many times over.
constexpr std::size_t kSize = std::size_t{1} << 20;

// Handlers are given nothing.
std::unique_ptr<std::array<char, kSize>> reserve;
const char* endingProgram = "";

[[noreturn]] void endOnUncaughtException() {
  try {
    if (const std::exception_ptr uncaught = std::current_exception()) {
      std::rethrow_exception(uncaught);
    }
  } catch (const std::bad_alloc&) {
    for (const char* const text : {endingProgram, ": ", kOutOfMemory, "\n"}) {
      static_cast<void>(writeAll(STDERR_FILENO, std::string_view(text)));
    }
    _exit(static_cast<int>(ExitStatus::TemporaryFailure));
  } catch (...) {
    std::abort();
  }
  std::abort();
}

}  // namespace

ProgramError outOfMemory() {
  return {ExitStatus::TemporaryFailure, kOutOfMemory};
}

void endWhereMemoryIsWanted(const char* program) {
  endingProgram = program;
  std::set_terminate(endOnUncaughtException);
}

MemoryReserve::MemoryReserve() {
  // Not written to, so that it costs nothing until it is wanted.
  reserve = std::make_unique_for_overwrite<std::array<char, kSize>>();
  std::set_new_handler(release);
}

MemoryReserve::~MemoryReserve() {
  std::set_new_handler(nullptr);
  reserve.reset();
}

void MemoryReserve::requireUntouched() {
  if (reserve == nullptr) {
    throw std::bad_alloc();
  }
}

void MemoryReserve::release() {
  if (reserve == nullptr) {
    throw std::bad_alloc();
  }
  reserve.reset();
}

}  // namespace accounts

#include "fuzz/FuzzTarget.h"

#include <sys/personality.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <iostream>

#include "propertylist/value/Description.h"

namespace accounts {

namespace {

[[noreturn]] void fail(std::string_view sentence) {
  std::cerr << "Not so: " << sentence << std::endl;
  std::abort();
}

void show(std::string_view name, const PropertyValue& value) {
  std::string description;
  appendDescription(description, value);
  std::cerr << name << ": " << description << '\n';
}

}  // namespace

void require(bool holds, std::string_view sentence) {
  if (!holds) {
    fail(sentence);
  }
}

void requireEqual(const PropertyValue& actual, const PropertyValue& expected,
                  std::string_view sentence) {
  if (actual != expected) {
    show("actual", actual);
    show("expected", expected);
    fail(sentence);
  }
}

}  // namespace accounts

/// Starts the program again with its memory at the addresses of every run: pointers are compared,
/// and the engine watches comparisons. Where that is refused, runs with the same seed try different
/// inputs.
extern "C" int LLVMFuzzerInitialize(int*, char*** arguments) {
  constexpr unsigned long kUnchanged = 0xffffffff;
  const int current = ::personality(kUnchanged);
  if (current != -1 && (current & ADDR_NO_RANDOMIZE) == 0 &&
      ::personality(static_cast<unsigned long>(current | ADDR_NO_RANDOMIZE)) != -1) {
    ::execv("/proc/self/exe", *arguments);
  }
  return 0;
}

/// The fuzzing engine's entry point.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  accounts::runOneInput(std::string_view(reinterpret_cast<const char*>(bytes), size));
  return 0;
}

/// The options of AddressSanitizer, which would otherwise keep up to 256 MiB of freed memory aside:
/// as much as an input may need in all.
extern "C" const char* __asan_default_options() {
  return "quarantine_size_mb=8:malloc_context_size=8";
}

#pragma once

#include "commandline/ExitStatus.h"

namespace accounts {

/// The error of a program that has no memory.
ProgramError outOfMemory();

/// Lets the program print that error and end with its status where std::bad_alloc can go no
/// further, such as in a destructor of a library. `program` is its name; it must live as long as
/// the process.
void endWhereMemoryIsWanted(const char* program);

/// Memory that is put aside for what must not end halfway: the first allocation of the process that
/// finds none gets it, and so do those that follow until that is used up, too. One at a time.
class MemoryReserve {
 public:
  MemoryReserve();
  MemoryReserve(const MemoryReserve&) = delete;
  MemoryReserve& operator=(const MemoryReserve&) = delete;
  ~MemoryReserve();

  /// To be called before something begins that must not end halfway. Throws std::bad_alloc when the
  /// reserve is used up.
  static void requireUntouched();

 private:
  static void release();
};

}  // namespace accounts

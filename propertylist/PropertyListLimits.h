#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

/// What readers, writers and those who serialise refuse, so that nothing is written that cannot be
/// read again.
namespace accounts {

/// How deep containers may stand in each other; a scalar alone has depth 0, an array of scalars 1.
/// Account files need fewer than ten. The bound is low enough for everything that walks a value
/// (comparison, description, destruction) to recurse safely on a small thread stack.
inline constexpr std::size_t kMaximumNestingDepth = 512;

/// How many bytes a file may have. Settings files hold kilobytes; a larger one, such as a sparse
/// file of terabytes in a damaged image, would only use up the machine's memory or disk.
inline constexpr std::size_t kMaximumFileSize = std::size_t{256} << 20;

/// How many objects a binary file may list. Four times what 100,000 accounts with 40 values each
/// need if no two values are equal; the tables for as many still fit a small machine's memory.
inline constexpr std::size_t kMaximumObjectCount = std::size_t{1} << 24;

/// How many values any property list may stand for, where a child that several containers share
/// counts each time it is reached: a file of a few hundred bytes can stand for billions, and
/// whoever walks the value would never come to an end. A text or data counts once more for every
/// `kBytesPerExpandedValue` bytes, since a long one can be reached many times as well; so does a
/// key.
inline constexpr std::uint64_t kMaximumExpandedValueCount = std::uint64_t{1} << 24;

/// How many values a binary file of a size may stand for, counted in the same way: what is done
/// with a file takes what goes with its size. Where equal parts are written once, accounts come to
/// a fifth of a value a byte; a small file may share more.
constexpr std::uint64_t maximumExpandedValueCount(std::size_t fileSize) {
  constexpr std::uint64_t kOfAnyFile = std::uint64_t{1} << 13;
  return std::min<std::uint64_t>(kMaximumExpandedValueCount, kOfAnyFile + fileSize);
}

/// How often a binary file of a size may reach a container again that it has reached before,
/// counted in the same way. An account's dictionary is its own, and takes as much of everybody's
/// time as a hundred values: an array of one of them would stand for as many accounts as it has
/// bytes. What accounts do share, lists of dataclasses above all, comes to one container in 20
/// bytes at most.
constexpr std::uint64_t maximumRepeatedContainerCount(std::size_t fileSize) {
  constexpr std::uint64_t kOfAnyFile = std::uint64_t{1} << 12;
  constexpr std::uint64_t kBytesForEach = 8;
  return kOfAnyFile + fileSize / kBytesForEach;
}

/// See `kMaximumExpandedValueCount`: together they hold the texts of one value to a gibibyte.
inline constexpr std::uint64_t kBytesPerExpandedValue = 64;

/// What a text or data of some length adds to the expanded count beyond the value itself.
constexpr std::uint64_t expandedCountOfBytes(std::size_t length) {
  return length / kBytesPerExpandedValue;
}

}  // namespace accounts

#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <tuple>

#include "tests/campaign/OtherProgram.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// What another program does to a place.
enum class Act : std::uint8_t {
  Replaces,
  /// The same by a program that has read the file before the run began.
  ReplacesBlindly,
  Writes,
  Removes,
  BringsBack
};

struct NamedAct {
  std::string_view name;
  DevicePlace place;
  Act act;
  /// Before so many calls, one after another.
  std::size_t count = 1;
};

/// What was written to a place by what was read there and the account that was added.
using Writings =
    std::map<std::tuple<DevicePlace, std::optional<std::string>, std::string>, std::string>;

/// One program that does one thing, once or again and again. Each time it writes something else.
class Intruder {
 public:
  /// All must outlive this. `before` is the device before the run; `writings` remembers what was
  /// written.
  Intruder(const NamedAct& act, const SimulatedDisk& before, Writings& writings)
      : act_(act), before_(before), writings_(writings) {}

  void operator()(OtherProgram& program);

  /// How often it has acted.
  [[nodiscard]] std::size_t times() const { return times_; }
  /// What was written last; none when it writes nothing of its own.
  [[nodiscard]] const std::optional<std::string>& written() const { return written_; }
  /// The account in it.
  [[nodiscard]] std::string identifier() const { return "OTHER-" + std::to_string(times_); }

 private:
  std::string next(const SimulatedDisk& disk);
  [[nodiscard]] std::string with(const std::optional<std::string>& contents,
                                 const std::string& identifier) const;

  const NamedAct& act_;
  const SimulatedDisk& before_;
  Writings& writings_;
  std::size_t times_ = 0;
  std::optional<std::string> written_;
};

}  // namespace accounts

#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "tests/program/RunProgram.h"

namespace accounts {

/// A directory with many small images, and what engines need to migrate them.
class FleetFixture : public testing::Test {
 public:
  FleetFixture(const FleetFixture&) = delete;
  FleetFixture& operator=(const FleetFixture&) = delete;

 protected:
  FleetFixture();
  ~FleetFixture() override;

  [[nodiscard]] std::filesystem::path directory() const { return directory_; }
  /// The root of an image.
  [[nodiscard]] std::filesystem::path image(int number) const;
  /// Makes an image with an old settings file that has one account.
  void makeImage(int number) const;
  /// Makes images 1 to `count` and the file that lists them; returns its path.
  [[nodiscard]] std::string makeImages(int count) const;

  /// The version that an image's settings file has.
  [[nodiscard]] std::int64_t versionOf(int number) const;
  /// How to run a program with the tested programs on its search path.
  [[nodiscard]] ProgramCall call(const std::string& program,
                                 const std::vector<std::string>& arguments) const;

  /// An example of the fleet.
  static std::string example(const std::string& name);

  std::map<std::string, std::string> environment;

 private:
  std::filesystem::path directory_;
};

}  // namespace accounts

#pragma once

#include <string>

namespace accounts {

/// Why a property list could not be read or written, for an engineer.
struct PropertyListError {
  /// What is wrong and where: an offset in bytes, or a line of an XML file.
  std::string text;
};

}  // namespace accounts

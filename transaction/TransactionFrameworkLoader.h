#pragma once

#include <string>
#include <string_view>

#include "platform/FrameworkLoader.h"

namespace accounts {

/// The frameworks of a migration in memory, which loads none: it notifies nobody and makes no full
/// account, and a framework is code of the device. The classes that are known stay known.
class TransactionFrameworkLoader final : public FrameworkLoader {
 public:
  /// `beneath` must outlive this.
  explicit TransactionFrameworkLoader(FrameworkLoader& beneath) : beneath_(beneath) {}

  Result loadFramework(std::string_view path) override {
    return Failure{.text = "A migration loads no framework: " + std::string(path)};
  }
  ClassRegistry& classes() override { return beneath_.classes(); }

 private:
  FrameworkLoader& beneath_;
};

}  // namespace accounts

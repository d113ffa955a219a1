#include "tests/program/FreshIdentifiers.h"

#include <algorithm>

namespace accounts {
namespace {

constexpr std::string_view kForm = "XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX";

bool isIdentifierAt(std::string_view bytes, std::size_t position) {
  return std::ranges::equal(kForm, bytes.substr(position, kForm.size()), [](char form, char found) {
    return form == '-' ? found == '-'
                       : (found >= '0' && found <= '9') || (found >= 'A' && found <= 'F');
  });
}

/// Calls `take` with every identifier that bytes hold, and its position.
template <class Take>
void forEachIdentifier(std::string_view bytes, const Take& take) {
  for (std::size_t hyphen = bytes.find('-'); hyphen != std::string_view::npos;
       hyphen = bytes.find('-', hyphen + 1)) {
    constexpr std::size_t kFirstHyphen = kForm.find('-');
    if (hyphen >= kFirstHyphen && isIdentifierAt(bytes, hyphen - kFirstHyphen)) {
      take(bytes.substr(hyphen - kFirstHyphen, kForm.size()), hyphen - kFirstHyphen);
      hyphen += kForm.size() - kFirstHyphen - 1;
    }
  }
}

}  // namespace

FreshIdentifiers::FreshIdentifiers(const DeviceTree& before) {
  for (const auto& [path, entry] : before) {
    forEachIdentifier(entry.contents,
                      [this](std::string_view each, std::size_t) { known_.emplace(each); });
  }
}

std::string FreshIdentifiers::named(std::string_view bytes) {
  std::string result(bytes);
  forEachIdentifier(bytes, [&](std::string_view each, std::size_t position) {
    if (known_.contains(each)) {
      return;
    }
    auto name = names_.find(each);
    if (name == names_.end()) {
      std::string text = std::to_string(names_.size() + 1);
      text.insert(0, "fresh identifier ").resize(kForm.size(), '.');
      name = names_.emplace(each, std::move(text)).first;
    }
    result.replace(position, kForm.size(), name->second);
  });
  return result;
}

}  // namespace accounts

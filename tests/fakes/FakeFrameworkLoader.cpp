#include "tests/fakes/FakeFrameworkLoader.h"

namespace accounts {

Result FakeFrameworkLoader::loadFramework(std::string_view path) {
  loads.emplace_back(path);
  const auto error = errors.find(path);
  if (error != errors.end()) {
    return Failure{.text = error->second};
  }
  const auto framework = frameworks.find(path);
  if (framework != frameworks.end()) {
    for (const auto& [name, accountClass] : framework->second) {
      registerClass(name, accountClass);
    }
  }
  return {};
}

void FakeFrameworkLoader::registerClass(std::string name, AccountClass accountClass) {
  classes_.insert_or_assign(std::move(name), std::move(accountClass));
}

const AccountClass* FakeFrameworkLoader::classNamed(std::string_view name) const {
  const auto place = classes_.find(name);
  return place != classes_.end() ? &place->second : nullptr;
}

}  // namespace accounts

#include "platform/linux/LinuxFrameworkLoader.h"

#include <dlfcn.h>

#include <utility>

namespace accounts {

namespace {

constexpr const char* kEntryPoint = "RegisterClasses";

}  // namespace

Result LinuxFrameworkLoader::loadFramework(std::string_view path) {
  if (loaded_.contains(path)) {
    return Result::success();
  }
  PathError error;
  std::optional<FileDescriptor> file = root_.openRegularFile(path, error);
  if (!file) {
    return Result::failure(error.text);
  }
  // Loaded through its descriptor: a path would be looked up again, and could then lead out of the
  // root.
  const std::string descriptorPath = "/proc/self/fd/" + std::to_string(file->number());
  void* library = dlopen(descriptorPath.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr) {
    return Result::failure(dlerror());
  }
  // Never closed from here on: the dynamic loader knows the framework by the name of its
  // descriptor, which must not come to mean another file as long as the process lives.
  static_cast<void>(file->release());
  void* entryPoint = dlsym(library, kEntryPoint);
  if (entryPoint == nullptr) {
    const Result missing = Result::failure(dlerror());
    dlclose(library);
    return missing;
  }
  loaded_.emplace(path);
  reinterpret_cast<decltype(&RegisterClasses)>(entryPoint)(*this);
  return Result::success();
}

void LinuxFrameworkLoader::registerClass(std::string name, AccountClass accountClass) {
  classes_.insert_or_assign(std::move(name), std::move(accountClass));
}

const AccountClass* LinuxFrameworkLoader::classNamed(std::string_view name) const {
  const auto place = classes_.find(name);
  return place != classes_.end() ? &place->second : nullptr;
}

}  // namespace accounts

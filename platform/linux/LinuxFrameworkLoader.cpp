#include "platform/linux/LinuxFrameworkLoader.h"

#include <dlfcn.h>
#include <sys/stat.h>

#include <cerrno>
#include <exception>
#include <filesystem>
#include <new>

#include "platform/linux/LoadedInterface.h"
#include "propertylist/value/Description.h"

namespace accounts {

namespace {

/// Calls a framework's entry point.
Result registerClassesOf(void* entryPoint, ClassRegistry& registry) {
  try {
    reinterpret_cast<decltype(&RegisterClasses)>(entryPoint)(registry);
    return {};
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const std::exception& exception) {
    return Failure{.text = std::string("It threw an exception: ") + exception.what()};
  } catch (...) {
    return Failure{.text = "It threw an exception without words"};
  }
}

}  // namespace

Result LinuxFrameworkLoader::loadFramework(std::string_view path) {
  const auto file = root_.openRegularFile(path);
  if (!file) {
    return file.error();
  }
  struct stat status = {};
  if (::fstat(file->number(), &status) != 0) {
    return pathFailure("look at", path, errno);
  }
  const std::pair identity(status.st_dev, status.st_ino);
  if (loaded_.contains(identity)) {
    return {};
  }
  // By the name that the opened file has on this machine, so that $ORIGIN means its directory. Who
  // could put another file there meanwhile could as well write into this one.
  std::error_code unnamed;
  const auto name =
      std::filesystem::read_symlink("/proc/self/fd/" + std::to_string(file->number()), unnamed);
  if (unnamed) {
    return pathFailure("name", path, unnamed.value());
  }
  void* library = dlopen(name.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr) {
    return Failure{.text = dlerror()};
  }
  void* entryPoint = dlsym(library, kFrameworkEntryPoint);
  if (entryPoint == nullptr) {
    const Result missing = Failure{.text = dlerror()};
    dlclose(library);
    return missing;
  }
  if (const auto otherVersion = whyOtherInterface(library)) {
    dlclose(library);
    return Failure{.text = *otherVersion};
  }
  loaded_.insert(identity);
  registering_ = path;
  const Result registered = registerClassesOf(entryPoint, *this);
  registering_.clear();
  return registered;
}

void LinuxFrameworkLoader::registerClass(std::string name, AccountClass accountClass) {
  const auto known = classes_.find(name);
  if (known == classes_.end() || registering_.empty()) {
    classes_.insert_or_assign(std::move(name), Registered{std::move(accountClass), registering_});
    return;
  }
  const std::string& first = known->second.framework;
  log_.writeLine(escapedText("The class " + name + " of the framework " + registering_ +
                             " is not taken: " + (first.empty() ? "the system" : first) +
                             " has one of that name"));
}

std::vector<std::string> LinuxFrameworkLoader::classNames() const {
  std::vector<std::string> names;
  for (const auto& [name, registered] : classes_) {
    names.push_back(name);
  }
  return names;
}

const AccountClass* LinuxFrameworkLoader::classNamed(std::string_view name) const {
  const auto place = classes_.find(name);
  return place != classes_.end() ? &place->second.accountClass : nullptr;
}

}  // namespace accounts

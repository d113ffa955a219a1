#include "host/PluginBundle.h"

#include <dlfcn.h>

#include <new>
#include <string>
#include <system_error>

#include "platform/linux/LoadedInterface.h"

namespace accounts {
namespace {

constexpr const char* kPluginName = "AccountsDataMigrator.so";
constexpr const char* kEntryPointName = "CreateMigrationPlugin";

/// Throws std::bad_alloc when there is no room to load a file. The loader does not tell that from a
/// file that cannot be loaded.
void requireMemoryFor(const std::filesystem::path& library) {
  constexpr std::size_t kBeside = std::size_t{1} << 20;
  std::error_code error;
  const std::uintmax_t size = std::filesystem::file_size(library, error);
  const std::size_t room = (error ? 0 : 2 * static_cast<std::size_t>(size)) + kBeside;
  const std::unique_ptr<char[]> probe(new char[room]);
}

ProgramError missing(const std::string& message) {
  return ProgramError{ExitStatus::MissingInput, message};
}

}  // namespace

std::filesystem::path PluginBundle::plugin() const {
  return path_ / kPluginName;
}

OrProgramError<PluginBundle> PluginBundle::find(const std::optional<std::filesystem::path>& path) {
  // Absolute, because dlopen would search its own directories for a bare file name.
  std::error_code error;
  PluginBundle bundle(std::filesystem::absolute(path ? *path : bundleOfProgram(), error));
  if (!std::filesystem::is_directory(bundle.path_, error)) {
    return missing("No bundle at " + bundle.path_.string());
  }
  if (!std::filesystem::is_regular_file(bundle.plugin(), error)) {
    return missing("No " + std::string(kPluginName) + " in the bundle " + bundle.path_.string());
  }
  return bundle;
}

OrProgramError<LoadedPlugin> PluginBundle::load() const {
  // Never closed: objects of the plug-in may live as long as the process.
  void* const library = dlopen(plugin().c_str(), RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr) {
    requireMemoryFor(plugin());
    return missing("The plug-in cannot be loaded: " + std::string(dlerror()));
  }
  // dlsym() gives functions as object pointers; POSIX promises that this conversion works.
  auto* const entryPoint =
      reinterpret_cast<LoadedPlugin::EntryPoint*>(dlsym(library, kEntryPointName));
  if (entryPoint == nullptr) {
    return missing("The plug-in has no entry point " + std::string(kEntryPointName) + ": " +
                   plugin().string());
  }
  if (const auto otherVersion = whyOtherInterface(library)) {
    return missing("The plug-in cannot be used: " + plugin().string() + ": " + *otherVersion);
  }
  return LoadedPlugin(*entryPoint);
}

OrProgramError<std::unique_ptr<MigrationPluginBase>> LoadedPlugin::makeInstance(
    Platform& platform) const {
  std::unique_ptr<MigrationPluginBase> instance(entryPoint_(platform));
  if (instance == nullptr) {
    return ProgramError{ExitStatus::PluginEnded, "The plug-in made no instance of its class"};
  }
  return instance;
}

}  // namespace accounts

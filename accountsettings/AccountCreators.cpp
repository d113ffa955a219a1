#include "accountsettings/AccountCreators.h"

#include <exception>
#include <new>

#include "accountsettings/BasicAccount.h"
#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "vocabulary/DevicePath.h"

namespace accounts {

PropertyArray creatorEntriesForType(const std::optional<Text>& type, std::string_view operation,
                                    std::string_view sourceFile) {
  const std::optional<PropertyDictionary>& map = BasicAccount::_accountCreationMap();
  std::optional<PropertyArray> entries = map && type ? map->arrayForKey(*type) : std::nullopt;
  if (!entries) {
    failAssertion(
        operation, sourceFile,
        "Malformed AccountCreators information. Could not find the information for the type %@",
        {type});
  }
  return *std::move(entries);
}

void loadCreatorFramework(std::string_view relativePath, std::string_view operation,
                          std::string_view sourceFile) {
  Platform& platform = Process::current().platform;
  const std::string path = joinedPath(platform.sharedResources.systemRootDirectory(), relativePath);
  const Result loaded = platform.frameworkLoader.loadFramework(path);
  if (!loaded) {
    failAssertion(operation, sourceFile,
                  "Could not load the account creator framework %@. Error %s",
                  {path, loaded.error().text});
  }
}

void failOnException(const std::optional<Text>& className, std::string_view operation,
                     std::string_view sourceFile) {
  std::string words;
  try {
    throw;
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const std::exception& exception) {
    words = exception.what();
  } catch (...) {
    words = "one without words";
  }
  failAssertion(operation, sourceFile, "The class %@ threw an exception: %@", {className, words});
}

const AccountClass* creatorClassNamed(std::string_view name) {
  return Process::current().platform.frameworkLoader.classes().classNamed(name);
}

}  // namespace accounts

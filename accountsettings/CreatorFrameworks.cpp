#include "accountsettings/CreatorFrameworks.h"

#include "accountsettings/Log.h"
#include "accountsettings/Paths.h"
#include "accountsettings/Process.h"

namespace accounts {

void loadCreatorFramework(std::string_view relativePath, std::string_view operation,
                          std::string_view sourceFile) {
  Platform& platform = Process::current().platform;
  const std::string path =
      pathByAppending(platform.sharedResources.systemRootDirectory(), relativePath);
  const Result loaded = platform.frameworkLoader.loadFramework(path);
  if (!loaded) {
    failAssertion(operation, sourceFile,
                  "Could not load the account creator framework %@. Error %s",
                  {path, loaded.error()});
  }
}

}  // namespace accounts

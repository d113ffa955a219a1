#include "platform/overlay/OverlaySharedResources.h"

namespace accounts {
namespace {

class UncontestedLock final : public NamedLock {
 public:
  void lock() override {}
  void unlock() override {}
};

}  // namespace

std::unique_ptr<NamedLock> OverlaySharedResources::makeLock(std::string_view name) {
  const std::string path = (lockDirectory_ + "/").append(name);
  const std::optional<EntryKind> kind = files_.kindOfEntry(path);
  const bool canBeMade = kind == EntryKind::Nothing && files_.isDirectory(lockDirectory_);
  return canBeMade || kind == EntryKind::RegularFile ? std::make_unique<UncontestedLock>()
                                                     : nullptr;
}

}  // namespace accounts

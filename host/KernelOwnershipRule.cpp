#include "host/KernelOwnershipRule.h"

#include <unistd.h>

#include <cerrno>
#include <string>

#include "platform/linux/EntryIdentity.h"

namespace accounts {

KernelOwnershipRule::KernelOwnershipRule(const DeviceRoot& root)
    : names_(root), self_{::geteuid(), ::getegid()} {}

OrFailure<FileOwner> KernelOwnershipRule::ownerNamed(std::string_view ownerName,
                                                     std::string_view groupName) {
  const auto user = names_.userIdentifier(std::string(ownerName));
  const auto group = user ? names_.groupIdentifier(std::string(groupName)) : user.error();
  if (!group) {
    return group.error();
  }
  const FileOwner owner = {*user, *group};
  if (self_.user != 0 && owner != self_) {
    return Failure{
        EPERM, "A file cannot be given to " + std::string(ownerName) + ": Operation not permitted"};
  }
  return owner;
}

}  // namespace accounts

#pragma once

#include <string>

#include "platform/HomeDirectory.h"
#include "platform/MailDirectory.h"

namespace accounts {

/// The directory Library/Mail in the home directory. `home` must outlive this.
class LinuxMailDirectory final : public MailDirectory {
 public:
  explicit LinuxMailDirectory(HomeDirectory& home) : home_(home) {}

  std::string path() override;

 private:
  HomeDirectory& home_;
};

}  // namespace accounts

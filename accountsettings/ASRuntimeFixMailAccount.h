#pragma once

#include <array>

#include "accountsettings/RuntimeFixer.h"

extern "C" {
/// Called when a converted account has the generic class "MailAccount". Does nothing: a fixed place
/// for a debugger to stop.
void reportMailAccountClassFound();
}

namespace accounts {

/// Restores the class of mail accounts whose class is not a known one from the path of their mail
/// directory, and tells the mail application once such a repair was saved.
class ASRuntimeFixMailAccount : public RuntimeFixer {
 public:
  /// The account types that the fixer looks at; always the same object.
  static const std::array<std::string_view, 2>& supportedAccountTypes();

  FixResult fixBasicAccountIfNeeded_loggingMessage(BasicAccount& account,
                                                   std::string_view loggingMessage) override;
  void accountsHaveBeenSaved(bool saved) override;

  /// Sets the class that the mail directory's path tells. False, with a channel line, when the path
  /// is missing or tells none.
  bool _cleanupAccountClass(BasicAccount& account);

 private:
  bool _shouldNotifyMobileMail = false;
};

}  // namespace accounts

#include "platform/linux/LinuxConsoleLog.h"

#include <string>

#include "platform/linux/FileContents.h"

namespace accounts {

void LinuxConsoleLog::writeLine(std::string_view line) {
  std::string text(line);
  text += '\n';
  // A log that cannot be written must not stop the work that it tells of.
  (void)writeAll(descriptor_, text);
}

}  // namespace accounts

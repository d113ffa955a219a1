#include "accountsctl/FrameworkCheck.h"

#include <dlfcn.h>
#include <fmt/format.h>
#include <unistd.h>

#include <filesystem>
#include <utility>
#include <vector>

#include "accountsctl/ExportedSymbols.h"
#include "accountsctl/JSONText.h"
#include "accountsctl/TextTable.h"
#include "commandline/PlatformError.h"
#include "platform/linux/LinuxFrameworkLoader.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

struct FrameworkFinding {
  const char* code;
  std::string text;
};

struct RegisteredClass {
  std::string name;
  /// The names of what it answers.
  std::vector<std::string> operations;
};

struct CheckedFramework {
  std::vector<std::string> exports;
  std::vector<RegisteredClass> classes;
  std::vector<FrameworkFinding> findings;
};

/// What the loader has to say is a finding here.
class FindingsLog : public ConsoleLog {
 public:
  explicit FindingsLog(std::vector<FrameworkFinding>& findings) : findings_(findings) {}
  void writeLine(std::string_view line) override {
    findings_.push_back({"doubledClass", std::string(line)});
  }

 private:
  std::vector<FrameworkFinding>& findings_;
};

std::vector<std::string> operationsOf(const AccountClass& answers) {
  const std::pair<const char*, bool> operations[] = {
      {"classForAccountType", answers.classForAccountType != nullptr},
      {"initWithProperties", answers.initWithProperties != nullptr},
      {"accountWithBasicAccount", answers.accountWithBasicAccount != nullptr},
      {"accountToRefreshForBasicAccount", answers.accountToRefreshForBasicAccount != nullptr},
      {"noteAccountChanges", answers.noteAccountChanges != nullptr},
      {"accountWillChange_forDataclass", answers.accountWillChange_forDataclass != nullptr},
      {"accountDidChange_forDataclass", answers.accountDidChange_forDataclass != nullptr},
  };
  std::vector<std::string> names;
  for (const auto& [name, isAnswered] : operations) {
    if (isAnswered) {
      names.emplace_back(name);
    }
  }
  return names;
}

void checkExports(CheckedFramework& framework) {
  std::vector<std::string> further;
  for (const std::string& name : framework.exports) {
    if (name != kFrameworkEntryPoint && name != kInterfaceVersionFunction) {
      further.push_back(name);
    }
  }
  if (!further.empty()) {
    framework.findings.push_back(
        {"furtherExports",
         fmt::format("{} of its symbols can meet those of another framework, {} first; "
                     "add_accounts_framework lets it export what it has to alone",
                     further.size(), further.front())});
  }
}

void checkClasses(CheckedFramework& framework) {
  if (framework.classes.empty()) {
    framework.findings.push_back({"noClass", "It registers no class"});
  }
  for (const RegisteredClass& registered : framework.classes) {
    if (registered.operations.empty()) {
      framework.findings.push_back(
          {"emptyClass", "The class " + registered.name + " answers nothing"});
    }
  }
}

std::string textOf(const CheckedFramework& framework, const Terminal& terminal) {
  TextTable table({"Class", "Answers"});
  for (const RegisteredClass& registered : framework.classes) {
    table.addRow({registered.name, fmt::format("{}", fmt::join(registered.operations, ", "))});
  }
  std::string text = framework.classes.empty() ? "" : table.text(terminal);
  text += fmt::format("Built for version {} of the interface\n", kInterfaceVersion);
  for (const FrameworkFinding& finding : framework.findings) {
    text += escapedText(finding.text) + "\n";
  }
  return framework.findings.empty() ? text + "Nothing found\n" : text;
}

std::string objectLine(const FrameworkCheckOptions& options, const CheckedFramework& framework,
                       ExitStatus exitStatus) {
  JSON object = reportObject("check");
  object["framework"] = options.file;
  object["interfaceVersion"] = kInterfaceVersion;
  object["exports"] = framework.exports;
  object["classes"] = JSON::array();
  for (const RegisteredClass& registered : framework.classes) {
    object["classes"].push_back({{"name", registered.name}, {"operations", registered.operations}});
  }
  object["findings"] = JSON::array();
  for (const FrameworkFinding& finding : framework.findings) {
    object["findings"].push_back({{"code", finding.code}, {"text", finding.text}});
  }
  return lineOf(std::move(object), exitStatus);
}

}  // namespace

CommandResult checkFramework(const FrameworkCheckOptions& options, const Terminal& terminal,
                             const CommandWorker& /*worker*/) {
  // What the framework itself writes is not the report.
  ::dup2(STDERR_FILENO, STDOUT_FILENO);
  const auto root = DeviceRoot::openRoot("/");
  if (!root) {
    return programErrorOf(root.error(), ExitStatus::MissingInput);
  }
  CheckedFramework framework;
  FindingsLog log(framework.findings);
  LinuxFrameworkLoader loader(*root, log);
  const std::string path = std::filesystem::absolute(options.file).string();
  if (const Result loaded = loader.loadFramework(path); !loaded) {
    const Failure& failure = loaded.error();
    return failure.number != 0
               ? ProgramError{exitStatusOf(failure, ExitStatus::MissingInput), failure.text}
               : ProgramError{ExitStatus::MalformedInput,
                              escapedText("No device loads " + options.file + ": " + failure.text)};
  }
  framework.exports = exportedSymbols(::dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD));
  for (const std::string& name : loader.classNames()) {
    framework.classes.push_back({name, operationsOf(*loader.classes().classNamed(name))});
  }
  checkExports(framework);
  checkClasses(framework);
  const ExitStatus exitStatus =
      framework.findings.empty() ? ExitStatus::Success : ExitStatus::Attention;
  return CommandReport{options.reportsJSON ? objectLine(options, framework, exitStatus)
                                           : textOf(framework, terminal),
                       exitStatus};
}

}  // namespace accounts

#include "accountsctl/CommandLine.h"

#include <CLI/CLI.hpp>
#include <string_view>
#include <vector>

#include "accountsctl/PropertyListInput.h"

namespace accounts {
namespace {

constexpr const char* kVersion = "accountsctl " ACCOUNTSCTL_VERSION;

constexpr const char* kProgramDescription =
    "Shows, compares and checks the files of account migrations.";

constexpr const char* kExitStatuses =
    "  64  the arguments cannot be used\n"
    "  65  a file is not what it has to be\n"
    "  66  a file is missing or unreadable\n"
    "  73  the output file cannot be created\n"
    "  74  a file or standard output cannot be written or read\n";

constexpr const char* kProgramExamples =
    "Examples:\n"
    "  accountsctl show com.quarx.accountsettings.plist\n"
    "  accountsctl show --help\n";

constexpr const char* kShowDescription =
    "Show a settings file, a legacy store, a migration-information file, a device description or\n"
    "any other property list; which of them it is, its content tells. Passwords and the like are\n"
    "hidden.";

constexpr const char* kShowExamples =
    "\n"
    "Examples:\n"
    "  accountsctl show com.quarx.accountsettings.plist\n"
    "  accountsctl show --properties Accounts.plist | less\n"
    "  accountsctl show --json - < com.quarx.DataAccess.plist\n";

constexpr const char* kConvertDescription =
    "Write a property list as XML or in the binary format, its values unchanged. Nothing is "
    "hidden:\n"
    "the output holds every password that the input holds. What XML cannot hold is an error.";

constexpr const char* kConvertExamples =
    "\n"
    "Examples:\n"
    "  accountsctl convert settings.plist settings.xml --to xml\n"
    "  accountsctl convert settings.plist - --to xml | less\n"
    "  accountsctl convert edited.xml settings.plist --to binary\n";

std::string requireText(const std::string& value) {
  return value.empty() ? "must not be empty" : "";
}

constexpr const char* kXMLForm = "xml";
constexpr const char* kBinaryForm = "binary";

std::string requireForm(const std::string& value) {
  return value == kXMLForm || value == kBinaryForm ? "" : "must be xml or binary";
}

/// The options of every subcommand; the one that the arguments choose is filled.
struct Options {
  ShowOptions show;
  ConvertOptions convert;
  bool wantsJSON = false;
  bool wantsXML = false;
  std::string form;
  bool showsSecrets = false;
};

CLI::App& addSubcommand(CLI::App& program, const std::string& name, const std::string& description,
                        const std::string& exitStatuses, const std::string& examples) {
  CLI::App& subcommand = *program.add_subcommand(name, description);
  subcommand.set_version_flag("--version", kVersion, "Print the version and exit");
  subcommand.set_help_flag("-h,--help", "Print this help and exit");
  subcommand.footer("Exit status:\n" + exitStatuses + kExitStatuses + examples);
  return subcommand;
}

CLI::Option* addFile(CLI::App& subcommand, const std::string& name, std::string& destination,
                     const std::string& description) {
  return subcommand.add_option(name, destination, description)
      ->option_text(" ")
      ->required()
      ->check(requireText);
}

CLI::Option* addJSON(CLI::App& subcommand, Options& options) {
  return subcommand.add_flag("--json", options.wantsJSON,
                             "Write one JSON object on one line to standard output");
}

void addShowSecrets(CLI::App& subcommand, Options& options) {
  subcommand.add_flag("--show-secrets", options.showsSecrets,
                      "Show passwords, tokens and the like as well");
}

void addShow(CLI::App& program, Options& options) {
  CLI::App& show =
      addSubcommand(program, "show", kShowDescription, "  0   the file was shown\n", kShowExamples);
  addFile(show, "FILE", options.show.file, "The file, - for standard input");
  CLI::Option* json = addJSON(show, options);
  show.add_flag("--xml", options.wantsXML, "Write an XML property list to standard output")
      ->excludes(json);
  show.add_flag("--properties", options.show.withProperties, "Show every property of each account");
  addShowSecrets(show, options);
}

void addConvert(CLI::App& program, Options& options) {
  CLI::App& convert = addSubcommand(program, "convert", kConvertDescription,
                                    "  0   the output was written\n", kConvertExamples);
  addFile(convert, "IN", options.convert.input, "The file to read, - for standard input");
  addFile(convert, "OUT", options.convert.output, "The file to write, - for standard output");
  convert.add_option("--to", options.form, "The form of the output: xml or binary")
      ->option_text("FORM")
      ->required()
      ->check(requireForm);
  addJSON(convert, options);
}

ShownForm shownForm(const Options& options) {
  if (options.wantsXML) {
    return ShownForm::XML;
  }
  return options.wantsJSON ? ShownForm::JSON : ShownForm::Tables;
}

}  // namespace

CommandLine parseCommandLine(int argumentCount, const char* const* arguments) {
  Options options;
  CLI::App program(kProgramDescription, kProgramName);
  program.set_help_flag("-h,--help", "Print this help and exit");
  program.set_version_flag("--version", kVersion, "Print the version and exit");
  program.footer(kProgramExamples);
  addShow(program, options);
  addConvert(program, options);

  CommandLine commandLine;
  ArgumentParsing parsing = parseArguments(program, argumentCount, arguments);
  commandLine.wantsJSON = hasArgument(argumentCount, arguments, "--json");
  if (!program.get_subcommands().empty()) {
    commandLine.subcommand = program.get_subcommands().front()->get_name();
  }
  if (auto* text = std::get_if<RequestedText>(&parsing)) {
    commandLine.asked = std::move(*text);
    return commandLine;
  }
  if (auto* unusable = std::get_if<UnusableArguments>(&parsing)) {
    commandLine.asked = std::move(*unusable);
    return commandLine;
  }
  if (options.wantsJSON && options.convert.output == kStandardStream) {
    commandLine.asked = UnusableArguments{
        "OUT cannot be standard output with --json, which is for a report (--help explains)"};
    return commandLine;
  }
  const Secrets secrets = options.showsSecrets ? Secrets::Show : Secrets::Hide;
  if (*commandLine.subcommand == "show") {
    options.show.form = shownForm(options);
    options.show.secrets = secrets;
    commandLine.asked = options.show;
  } else {
    options.convert.form =
        options.form == kXMLForm ? PropertyListForm::XML : PropertyListForm::Binary;
    options.convert.reportsJSON = options.wantsJSON;
    commandLine.asked = options.convert;
  }
  return commandLine;
}

}  // namespace accounts

#include "accountsctl/CommandLine.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <string_view>
#include <utility>
#include <vector>

#include "accountsctl/HelpTexts.h"
#include "commandline/OptionDeclarations.h"
#include "commandline/Subcommands.h"
#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

constexpr const char* kVersion = "accountsctl " ACCOUNTSCTL_VERSION;
constexpr const char* kXMLForm = "xml";
constexpr const char* kBinaryForm = "binary";

std::string requireForm(const std::string& value) {
  return value == kXMLForm || value == kBinaryForm ? "" : "must be xml or binary";
}

/// The lists of images that a summary can give in its place.
constexpr std::pair<std::string_view, ListedImages> kLists[] = {{"retry", {Remedy::Retry}},
                                                                {"attention", {Remedy::Attention}},
                                                                {"losses", {Remedy::Losses}},
                                                                {"migrated", {Remedy::None}},
                                                                {"missing", {std::nullopt}}};
constexpr const char* kListNames = "retry, attention, losses, migrated or missing";

std::optional<ListedImages> listNamed(std::string_view name) {
  for (const auto& [known, images] : kLists) {
    if (known == name) {
      return images;
    }
  }
  return std::nullopt;
}

std::string requireLoadableFile(const std::string& value) {
  return value == kStandardStream ? "must be a file, since standard input cannot be loaded" : "";
}

std::string requireNamedPage(const std::string& value) {
  return value == kStandardStream ? "must be a file, since standard output carries the summary"
                                  : "";
}

std::string requireList(const std::string& value) {
  return listNamed(value) ? "" : std::string("must be ") + kListNames;
}

/// What is said of names of which only one may be standard input; none when it is said of none.
std::optional<std::string> severalStandardInputs(const std::vector<std::string>& files) {
  return std::count(files.begin(), files.end(), kStandardStream) > 1
             ? std::optional<std::string>("Only one of the files can be standard input")
             : std::nullopt;
}

/// The arguments of every subcommand; those of the one that is chosen are filled.
struct Arguments {
  ShowOptions show;
  DiffOptions diff;
  CheckOptions check;
  std::optional<std::string> framework;
  StatusOptions status;
  ConvertOptions convert;
  SummarizeOptions summarize;
  ExplainOptions explain;
  bool wantsJSON = false;
  bool wantsXML = false;
  bool showsSecrets = false;
  bool showsLongCells = false;
  std::string form;
  std::string list;

  [[nodiscard]] Secrets secrets() const { return showsSecrets ? Secrets::Show : Secrets::Hide; }
};

using Asked = decltype(CommandLine::asked);

void addFile(CLI::App& command, const std::string& name, std::string& destination,
             const std::string& description) {
  command.add_option(name, destination, description)
      ->option_text(" ")
      ->required()
      ->check(requireText);
}

CLI::Option* addJSON(CLI::App& command, Arguments& arguments) {
  return command.add_flag("--json", arguments.wantsJSON,
                          "Write one JSON object on one line to standard output");
}

void addShowSecrets(CLI::App& command, Arguments& arguments) {
  command.add_flag("--show-secrets", arguments.showsSecrets,
                   "Show passwords, tokens and the like as well");
}

CLI::Option* addBundle(CLI::App& command, std::optional<std::string>& bundle) {
  return addPath(command, "--plugin", bundle, "BUNDLE",
                 "The plug-in bundle (default: that of the program)");
}

void addShow(CLI::App& command, Arguments& arguments) {
  addFile(command, "FILE", arguments.show.file, "The file, - for standard input");
  CLI::Option* json = addJSON(command, arguments);
  command.add_flag("--xml", arguments.wantsXML, "Write an XML property list to standard output")
      ->excludes(json);
  command.add_flag("--properties", arguments.show.withProperties,
                   "Show every property of each account");
  command.add_flag("--full", arguments.showsLongCells,
                   "Show long texts whole on a terminal, over several lines");
  addShowSecrets(command, arguments);
}

Asked showAsked(Arguments& arguments) {
  arguments.show.form = arguments.wantsXML    ? ShownForm::XML
                        : arguments.wantsJSON ? ShownForm::JSON
                                              : ShownForm::Tables;
  arguments.show.secrets = arguments.secrets();
  arguments.show.longCells = arguments.showsLongCells ? LongCells::Wrapped : LongCells::Cut;
  return arguments.show;
}

void addDiff(CLI::App& command, Arguments& arguments) {
  addFile(command, "A", arguments.diff.before, "The older file, - for standard input");
  addFile(command, "B", arguments.diff.after, "The newer file, - for standard input");
  addJSON(command, arguments);
  addShowSecrets(command, arguments);
}

Asked diffAsked(Arguments& arguments) {
  if (const auto problem = severalStandardInputs({arguments.diff.before, arguments.diff.after})) {
    return unusableArguments(*problem);
  }
  arguments.diff.reportsJSON = arguments.wantsJSON;
  arguments.diff.secrets = arguments.secrets();
  return arguments.diff;
}

void addCheck(CLI::App& command, Arguments& arguments) {
  CLI::Option* file =
      command.add_option("FILE", arguments.check.file, "The file, - for standard input")
          ->option_text(" ")
          ->check(requireText);
  CLI::Option* device =
      addPath(command, "--device", arguments.check.device, "FILE",
              "The device description, - for standard input (default: this machine's "
              "/etc/device.plist, if there is one)");
  CLI::Option* bundle = addBundle(command, arguments.check.bundle);
  addPath(command, "--framework", arguments.framework, "FRAMEWORK",
          "Check a framework instead, a shared object, whose code then runs")
      ->check(requireLoadableFile)
      ->excludes(file)
      ->excludes(device)
      ->excludes(bundle);
  addJSON(command, arguments);
}

Asked checkAsked(Arguments& arguments) {
  if (arguments.framework) {
    return FrameworkCheckOptions{*arguments.framework, arguments.wantsJSON};
  }
  if (arguments.check.file.empty()) {
    return unusableArguments("FILE is required, or --framework");
  }
  if (const auto problem = severalStandardInputs(
          {arguments.check.file, arguments.check.device.value_or(std::string())})) {
    return unusableArguments(*problem);
  }
  arguments.check.reportsJSON = arguments.wantsJSON;
  return arguments.check;
}

void addStatus(CLI::App& command, Arguments& arguments) {
  addDevice(command, arguments.status.root, arguments.status.home);
  addPath(command, "--device", arguments.status.device, "FILE",
          "The device description, - for standard input (default: the root's /etc/device.plist, if "
          "there is one)");
  addBundle(command, arguments.status.bundle);
  command.add_flag("--fail-if-pending", arguments.status.failsIfPending,
                   "Exit with 1 if a migration has something to do");
  addJSON(command, arguments);
}

Asked statusAsked(Arguments& arguments) {
  arguments.status.reportsJSON = arguments.wantsJSON;
  return arguments.status;
}

void addConvert(CLI::App& command, Arguments& arguments) {
  addFile(command, "IN", arguments.convert.input, "The file to read, - for standard input");
  addFile(command, "OUT", arguments.convert.output, "The file to write, - for standard output");
  command.add_option("--to", arguments.form, "The form of the output: xml or binary")
      ->option_text("FORM")
      ->required()
      ->check(requireForm);
  addJSON(command, arguments);
}

Asked convertAsked(Arguments& arguments) {
  if (arguments.wantsJSON && arguments.convert.output == kStandardStream) {
    return unusableArguments("OUT cannot be standard output with --json, which is for a report");
  }
  arguments.convert.form =
      arguments.form == kXMLForm ? PropertyListForm::XML : PropertyListForm::Binary;
  arguments.convert.reportsJSON = arguments.wantsJSON;
  return arguments.convert;
}

void addSummarize(CLI::App& command, Arguments& arguments) {
  SummarizeOptions& options = arguments.summarize;
  command
      .add_option("FILE", options.files,
                  "The results or reports, a directory with them, - for standard input")
      ->option_text("...")
      ->required()
      ->check(requireText);
  command
      .add_option_function<std::size_t>(
          "--expected", [&options](std::size_t count) { options.expected = count; },
          "How many images there are; those without a result are counted, too")
      ->option_text("COUNT")
      ->check(requireCount);
  addPath(command, "--roots", options.rootsFile, "ROOTS",
          "The roots of all images, one a line, - for standard input; results of others do not "
          "count")
      ->excludes("--expected");
  CLI::Option* html = addPath(command, "--html", options.html, "PAGE",
                              "Write a page over all images to PAGE, each with a link to the page "
                              "of its report")
                          ->check(requireNamedPage);
  CLI::Option* list =
      command
          .add_option("--list", arguments.list,
                      std::string("Write only the roots of the images to retry, that need "
                                  "attention, that are\nmigrated but not with everything, that "
                                  "are migrated, or that --roots names\nand no result: WHICH is ") +
                          kListNames)
          ->option_text("WHICH")
          ->check(requireList)
          ->excludes(html);
  command
      .add_flag("--null", options.endsWithNull,
                "End each root of a list with a null character, as xargs -0 takes it")
      ->needs(list);
  command
      .add_flag("--reasons", options.withReasons,
                "Write behind each root of a list why it is there, after a tab")
      ->needs(list)
      ->excludes("--null");
  addJSON(command, arguments)->excludes(list);
}

Asked summarizeAsked(Arguments& arguments) {
  std::vector<std::string> files = arguments.summarize.files;
  files.push_back(arguments.summarize.rootsFile.value_or(std::string()));
  if (const auto problem = severalStandardInputs(files)) {
    return unusableArguments(*problem);
  }
  if (arguments.list == "missing" && !arguments.summarize.rootsFile) {
    return unusableArguments("--list missing needs --roots, which names the images");
  }
  arguments.summarize.listed = listNamed(arguments.list);
  arguments.summarize.reportsJSON = arguments.wantsJSON;
  return arguments.summarize;
}

void addExplain(CLI::App& command, Arguments& arguments) {
  addFile(command, "REPORT", arguments.explain.report,
          "The report that plan or run --report wrote, - for standard input");
  addFile(command, "IDENTIFIER", arguments.explain.identifier,
          "The account's identifier, also one that it had before");
  addJSON(command, arguments);
}

Asked explainAsked(Arguments& arguments) {
  arguments.explain.reportsJSON = arguments.wantsJSON;
  return arguments.explain;
}

constexpr ProgramTexts kProgram = {kProgramName, kVersion, help::kProgram, help::kProgramExamples,
                                   help::kErrors};

constexpr Subcommand<Arguments, Asked> kSubcommands[] = {
    {{"show", help::kShow, help::kShowStatuses, "", help::kShowExamples}, addShow, showAsked},
    {{"diff", help::kDiff, help::kDiffStatuses, "", help::kDiffExamples}, addDiff, diffAsked},
    {{"check", help::kCheck, help::kCheckStatuses, "", help::kCheckExamples}, addCheck, checkAsked},
    {{"status", help::kStatus, help::kStatusStatuses, "", help::kStatusExamples},
     addStatus,
     statusAsked},
    {{"convert", help::kConvert, help::kConvertStatuses, "", help::kConvertExamples},
     addConvert,
     convertAsked},
    {{"summarize", help::kSummarize, help::kSummarizeStatuses, "", help::kSummarizeExamples},
     addSummarize,
     summarizeAsked},
    {{"explain", help::kExplain, help::kExplainStatuses, "", help::kExplainExamples},
     addExplain,
     explainAsked},
};

}  // namespace

CommandLine parseCommandLine(int argumentCount, const char* const* arguments) {
  Arguments parsed;
  auto [asked, subcommand] =
      parseSubcommands<Arguments, Asked>(kProgram, kSubcommands, argumentCount, arguments, parsed);
  return {.asked = std::move(asked),
          .subcommand = std::move(subcommand),
          .root = valueOfOption(argumentCount, arguments, "--root"),
          .wantsJSON = hasArgument(argumentCount, arguments, "--json")};
}

}  // namespace accounts

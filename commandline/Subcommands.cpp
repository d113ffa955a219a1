#include "commandline/Subcommands.h"

#include "commandline/OptionDeclarations.h"

namespace accounts {

void describeProgram(CLI::App& program, const ProgramTexts& texts) {
  program.name(texts.name);
  program.description(texts.description);
  addHelpAndVersion(program, texts.version);
  program.footer(texts.examples);
}

CLI::App& addSubcommand(CLI::App& program, const ProgramTexts& programTexts,
                        const SubcommandTexts& texts) {
  CLI::App& command = *program.add_subcommand(texts.name, texts.description);
  addHelpAndVersion(command, programTexts.version);
  command.footer(std::string("Exit status:\n") + texts.exitStatuses + programTexts.errors +
                 texts.errors + "\nExamples:\n" + texts.examples);
  return command;
}

}  // namespace accounts

// `vexil`, the command-line host of the library: language servers (`lsp`), directory
// watching (`watch`), watcher tasks (`task`) and the show-case behind `make demo` (`demo`).
#include <exception>
#include <iostream>

#include "commands.h"
#include "host_process.h"

namespace {

struct Command {
  const char* name;
  int (*run)(const cli::Arguments&);
  std::string (*help)();
  const char* synopsis;
};

const Command kCommands[] = {
    {"lsp", cli::RunLsp, cli::LspHelp, "[OPTION]... -- SERVER [ARG]... ACTION...  ask a language server"},
    {"watch", cli::RunWatch, cli::WatchHelp, "DIR...  print every change below the directories"},
    {"task", cli::RunTask, cli::TaskHelp, "--ext EXT[,EXT]... --run COMMAND [OPTION]... DIR...  run a command "
                                           "for each changed file"},
    {"demo", cli::RunDemo, cli::DemoHelp, "[--examples DIR]  show the library driving clangd, pylsp and watchers"},
};

std::string Usage() {
  std::string text = "Usage:";
  for (const Command& command : kCommands) {
    text += std::string(text == "Usage:" ? " " : "       ") + "vexil " + command.name + " " + command.synopsis + "\n";
  }
  return text +
         "       vexil --help | --version\n"
         "\n'vexil COMMAND --help' shows a command's options. Exit status: 0 success, 1 failure,\n"
         "2 bad usage, 130 or 143 when interrupted by Ctrl-C or SIGTERM.\n";
}

const Command* Find(const std::string& name) {
  for (const Command& command : kCommands)
    if (name == command.name) return &command;
  return nullptr;
}

int Run(const cli::Arguments& arguments, std::string& helpName) {
  if (arguments.empty()) throw cli::UsageError("no command given");
  const std::string& name = arguments[0];
  if (name == "--version") {
    std::cout << "vexil " VEXIL_VERSION "\n";
    return 0;
  }
  if (name == "--help" || name == "-h" || name == "help") {
    std::cout << Usage();
    return 0;
  }
  const Command* command = Find(name);
  if (!command) throw cli::UsageError("unknown command '" + name + "'");
  helpName = "vexil " + name;
  try {
    return command->run(cli::Arguments(arguments.begin() + 1, arguments.end()));
  } catch (const cli::HelpRequested&) {
    std::cout << command->help();
    return 0;
  }
}

}  // namespace

int main(int argc, char** argv) {
  // A task's command, run by the task itself: nothing of the host's set-up applies.
  if (argc == 2 && argv[1][0] == cli::kWordSeparator) return cli::RunWords(argv[1]);
  cli::WatchProcess();
  std::string helpName = "vexil";
  try {
    return Run(cli::Arguments(argv + 1, argv + argc), helpName);
  } catch (const cli::UsageError& error) {
    std::cerr << "vexil: " << error.what() << ". Try '" << helpName << " --help'\n";
    return 2;
  } catch (const std::exception& error) {
    std::cerr << "vexil: " << error.what() << "\n";
    return 1;
  }
}

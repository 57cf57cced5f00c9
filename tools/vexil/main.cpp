// `vexil`, the command-line host of the library: language servers (`lsp`), directory
// watching (`watch`), watcher tasks (`task`) and the show-case behind `make demo` (`demo`).
#include <exception>
#include <iostream>

#include "commands.h"
#include "lsp_options.h"

namespace {

const char kUsage[] =
    "usage: vexil lsp [--trace off|messages|verbose] [--timeout MS] [--root DIR] [--language ID] [--json]\n"
    "                 -- SERVER [ARGS...] ACTION...\n"
    "       vexil watch DIR...\n"
    "       vexil task --ext EXT[,EXT...] --run 'COMMAND with $FN tags' [--shell] [--timeout MS] DIR...\n"
    "       vexil demo [--examples DIR]\n"
    "\n"
    "lsp actions, performed in order (lines and columns count from 1):\n"
    "  --open FILE                --hover FILE:LINE:COL         --definition FILE:LINE:COL\n"
    "  --declaration FILE:LINE:COL --type-definition FILE:LINE:COL --implementation FILE:LINE:COL\n"
    "  --references FILE:LINE:COL --completion FILE:LINE:COL    --signature FILE:LINE:COL\n"
    "  --symbols FILE             --workspace-symbols QUERY     --format FILE\n"
    "  --range-format FILE:L1:C1:L2:C2  --rename FILE:LINE:COL:NEWNAME\n"
    "  --change FILE (sends its current text)  --save FILE  --close FILE\n"
    "  --diagnostics FILE (path:line:col: severity: message [source code])\n"
    "A file is opened before its first action. Trace lines go to stderr; the time-out is\n"
    "5000 ms and the root the current directory unless given.\n"
    "task: runs the command for each changed file with a watched extension; without --shell\n"
    "the first word of --run is the program and the rest one argument; tags: $FN full name,\n"
    "$F file name, $FB base name, $EXT extension, $FDD directory.\n"
    "exit status: 0 success, 1 a server or request failed, 2 bad usage\n";

int Dispatch(const cli::Arguments& arguments) {
  if (arguments.empty()) throw cli::UsageError("no command given");
  const std::string& command = arguments[0];
  cli::Arguments rest(arguments.begin() + 1, arguments.end());
  if (command == "lsp") return cli::RunLsp(rest);
  if (command == "watch") return cli::RunWatch(rest);
  if (command == "task") return cli::RunTask(rest);
  if (command == "demo") return cli::RunDemo(rest);
  if (command == "--help" || command == "-h" || command == "help") {
    std::cout << kUsage;
    return 0;
  }
  throw cli::UsageError("unknown command '" + command + "'");
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return Dispatch(cli::Arguments(argv + 1, argv + argc));
  } catch (const cli::UsageError& error) {
    std::cerr << "vexil: " << error.what() << "\n\n" << kUsage;
    return 2;
  } catch (const std::exception& error) {
    std::cerr << "vexil: " << error.what() << "\n";
    return 1;
  }
}

// The commands of the `vexil` host. Each takes the arguments after its name and returns
// the process's exit status: 0 success, 1 failure, 2 bad usage (thrown as UsageError),
// 128 + the signal when interrupted. Each has its own help text for "vexil COMMAND --help".
#pragma once

#include <string>

#include "options.h"

namespace cli {

int RunLsp(const Arguments& arguments);
int RunWatch(const Arguments& arguments);
int RunTask(const Arguments& arguments);
int RunDemo(const Arguments& arguments);

std::string LspHelp();
std::string WatchHelp();
std::string TaskHelp();
std::string DemoHelp();

// The hidden command a task runs without --shell: the words of its command line, joined by
// kWordSeparator in one argument, run as a program and its arguments; the exit status is
// reported on standard error.
extern const char kWordSeparator;
int RunWords(const std::string& words);

}  // namespace cli

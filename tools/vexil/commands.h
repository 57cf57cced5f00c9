// The commands of the `vexil` host. Each takes the arguments after its name and returns
// the process's exit status: 0 success, 1 failure, 2 bad usage (thrown as UsageError).
#pragma once

#include <string>
#include <vector>

namespace cli {

using Arguments = std::vector<std::string>;

int RunLsp(const Arguments& arguments);
int RunWatch(const Arguments& arguments);
int RunTask(const Arguments& arguments);
int RunDemo(const Arguments& arguments);

}  // namespace cli

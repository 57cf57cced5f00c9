// `vexil lsp` run as a program in the C++ example against clangd: what it prints for
// people and as JSON, and its exit status for success, a missing server and bad usage.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cstdio>
#include <fstream>
#include <string>

#include "e2e_support.h"
#include "vexil_test/support.h"

namespace {

struct Outcome {
  int status = -1;
  std::string output;  // stdout, and stderr when asked for
};

// Runs a shell command line in the C++ example directory.
Outcome Shell(const std::string& script) {
  std::string command = "cd '" VEXIL_EXAMPLES "/cpp' && " + script;
  Outcome run;
  FILE* pipe = popen(command.c_str(), "r");
  if (!pipe) return run;
  char buffer[4096];
  for (std::size_t count; (count = fread(buffer, 1, sizeof buffer, pipe)) > 0;) run.output.append(buffer, count);
  int status = pclose(pipe);
  run.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return run;
}

Outcome Vexil(const std::string& arguments, bool withErrors = false) {
  return Shell("'" VEXIL_CLI "' " + arguments + (withErrors ? " 2>&1" : " 2>/dev/null"));
}

TEST(CommandLine, LspPrintsLocationsWithTheirSourceAndCompletionsOnePerLine) {
  Outcome run = Vexil("lsp -- clangd --log=error --definition main.cpp:15:18 --completion main.cpp:13:13");
  EXPECT_EQ(run.status, 0) << run.output;
  EXPECT_NE(run.output.find("definition main.cpp:15:18\n  shapes.h:28:5: int Clamp(int value, int low, int high);\n"),
            std::string::npos)
      << run.output;
  EXPECT_NE(run.output.find("\n  Scale(int factor)  : void\n"), std::string::npos) << run.output;
}

TEST(CommandLine, LspWritesOneJsonObjectPerQueryAndDiffsForRenames) {
  Outcome json = Vexil("lsp --json -- clangd --log=error --open shapes.h --references main.cpp:15:18");
  EXPECT_EQ(json.status, 0);
  EXPECT_EQ(json.output.rfind(R"({"action":"references","file":"main.cpp","line":15,"column":18,"failed":false,"result":[)", 0), 0u)
      << json.output;
  EXPECT_NE(json.output.find(R"("path":")" VEXIL_EXAMPLES R"(/cpp/main.cpp","line":15,"column":18,"endLine":15,"endColumn":23})"),
            std::string::npos);
  EXPECT_EQ(std::count(json.output.begin(), json.output.end(), '\n'), 1);

  Outcome rename = Vexil("lsp -- clangd --log=error --rename main.cpp:15:18:Limit");
  EXPECT_EQ(rename.status, 0);
  EXPECT_NE(rename.output.find("-  return shapes::Clamp(rectangle.Area(), 0, 100) == 48 ? 0 : 1;\n"
                               "+  return shapes::Limit(rectangle.Area(), 0, 100) == 48 ? 0 : 1;\n"),
            std::string::npos)
      << rename.output;
}

// pylsp announces no diagnostic provider, so the command waits for its publication.
TEST(CommandLine, LspPrintsDiagnosticsInTheCompilersFormat) {
  const vexil_test::TempDirectory directory;
  const std::string file = directory / "broken.py";
  { std::ofstream(file) << "import os\n\nprint(undefined_name)\n"; }
  Outcome run = Vexil("lsp -- pylsp --diagnostics " + file);
  EXPECT_EQ(run.status, 0) << run.output;
  EXPECT_NE(run.output.find(file + ":3:7: error: undefined name 'undefined_name' [pyflakes]\n"), std::string::npos)
      << run.output;
  EXPECT_NE(run.output.find(file + ":1:1: warning: 'os' imported but unused [pyflakes]\n"), std::string::npos)
      << run.output;
}

TEST(CommandLine, ExitStatusTellsFailureFromBadUsage) {
  Outcome missing = Vexil("lsp -- vexil-no-such-server --hover main.cpp:1:1", true);
  EXPECT_EQ(missing.status, 1);
  EXPECT_NE(missing.output.find("vexil: vexil-no-such-server did not start: Cannot find executable: vexil-no-such-server\n"),
            std::string::npos)
      << missing.output;
  Outcome bad = Vexil("lsp -- clangd --hover main.cpp:0:1", true);
  EXPECT_EQ(bad.status, 2);
  EXPECT_EQ(bad.output.rfind("vexil: LINE must be a positive number, not '0'\n\nusage: vexil lsp", 0), 0u) << bad.output;
  EXPECT_EQ(Vexil("frobnicate").status, 2);
}

}  // namespace

// `vexil task` runs its command for an edited file with a watched extension and ends
// cleanly on Ctrl-C. The file is edited until the task has seen it: the directory
// watcher settles in on a thread of its own.
TEST(CommandLine, TaskRunsItsCommandForAnEditedFileAndEndsOnInterrupt) {
  const std::string script =
      "dir=$(mktemp -d); echo x > \"$dir/a.cpp\"; echo x > \"$dir/a.txt\"; "
      "'" VEXIL_CLI "' task --ext cpp --run 'echo hit $F' --shell \"$dir\" > \"$dir/out\" 2>&1 & pid=$!; "
      "for i in $(seq 150); do echo y >> \"$dir/a.cpp\"; echo y >> \"$dir/a.txt\"; "
      "grep -q 'hit a.cpp' \"$dir/out\" && grep -q 'Ignoring changes' \"$dir/out\" && break; sleep 0.2; done; "
      "kill -INT $pid; wait $pid; echo \"status=$?\"; cat \"$dir/out\"; rm -rf \"$dir\"";
  Outcome run = Shell(script);
  EXPECT_NE(run.output.find("status=0\n"), std::string::npos) << run.output;
  EXPECT_NE(run.output.find("Message: hit a.cpp\n"), std::string::npos) << run.output;
  EXPECT_NE(run.output.find("=> Ignoring changes for File: "), std::string::npos) << run.output;
  EXPECT_NE(run.output.find("vexil: task released\n"), std::string::npos) << run.output;
  EXPECT_EQ(Vexil("task --run x /tmp").status, 2);
}

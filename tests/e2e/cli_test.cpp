// `vexil` run as a program, the way people use it, in the C++ example against clangd and
// pylsp: what it prints for people and as JSON Lines, its one-line failures with their
// exit status, and its end on an interrupt with nothing of it left running.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <chrono>
#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>

#include "e2e_support.h"
#include "vexil_test/support.h"

namespace {

struct Result {
  int status = -1;
  std::string out;
  std::string err;
  double seconds = 0;
};

std::string Slurp(const std::string& path) {
  std::ifstream in(path);
  std::stringstream text;
  text << in.rdbuf();
  return text.str();
}

// Runs a shell script in the C++ example directory; VEXIL names the program.
Result Shell(const std::string& script) {
  const vexil_test::TempDirectory scratch;
  const std::string command = "cd '" VEXIL_EXAMPLES "/cpp' && VEXIL='" VEXIL_CLI "' FAKE='" VEXIL_FAKE_SERVER
                              "' SCRATCH='" + scratch.Path().string() + "'; export VEXIL FAKE SCRATCH; (" + script +
                              ") >'" + (scratch / "out") + "' 2>'" + (scratch / "err") + "'";
  Result run;
  auto start = std::chrono::steady_clock::now();
  int status = std::system(command.c_str());
  run.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  run.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  run.out = Slurp(scratch / "out");
  run.err = Slurp(scratch / "err");
  return run;
}

Result Vexil(const std::string& arguments) { return Shell("\"$VEXIL\" " + arguments); }

TEST(CommandLine, LspPrintsLocationsWithTheirSourceAndCompletionsOnePerLine) {
  Result run = Vexil("lsp -- clangd --log=error --definition main.cpp:15:18 --completion main.cpp:13:13");
  EXPECT_EQ(run.status, 0) << run.err;
  EXPECT_NE(run.out.find("definition main.cpp:15:18\n  shapes.h:28:5: int Clamp(int value, int low, int high);\n"),
            std::string::npos)
      << run.out;
  EXPECT_NE(run.out.find("\n  Scale(int factor)  : void\n"), std::string::npos) << run.out;
  // Beyond the typed calls: what the server supports, and a request of any method.
  Result beyond = Shell(R"("$VEXIL" lsp -- clangd --log=error --capabilities --open main.cpp --request )"
                        R"(textDocument/documentHighlight "{\"textDocument\":{\"uri\":\"file://$PWD/main.cpp\"},)"
                        R"(\"position\":{\"line\":14,\"character\":17}}")");
  EXPECT_EQ(beyond.status, 0) << beyond.err;
  EXPECT_EQ(beyond.out.rfind("capabilities\n", 0), 0u) << beyond.out;
  EXPECT_NE(beyond.out.find("\n  documentHighlightProvider\n"), std::string::npos) << beyond.out;
  EXPECT_NE(beyond.out.find("\n  textDocumentSync: incremental changes, open and close, save\n"), std::string::npos);
  EXPECT_NE(beyond.out.find("request textDocument/documentHighlight\n  [{"), std::string::npos) << beyond.out;
  EXPECT_NE(beyond.out.find(R"("start":{"character":17,"line":14}})"), std::string::npos) << beyond.out;
  // Files are found below --root, whatever the current directory.
  Result python = Vexil("lsp --root=../python -- pylsp --hover=main.py:2:22");
  EXPECT_EQ(python.status, 0) << python.err;
  EXPECT_EQ(python.out.rfind("hover main.py:2:22\n", 0), 0u) << python.out;
}

TEST(CommandLine, LspWritesJsonLinesWithNamedKindsAndDiffsForRenames) {
  Result json = Vexil("lsp --json -- clangd --log=error --open shapes.h --references main.cpp:15:18 --symbols shapes.h");
  EXPECT_EQ(json.status, 0);
  EXPECT_EQ(json.out.rfind(R"({"action":"references","file":"main.cpp","line":15,"column":18,"failed":false,"result":[)", 0), 0u)
      << json.out;
  EXPECT_NE(json.out.find(R"("path":")" VEXIL_EXAMPLES R"(/cpp/main.cpp","line":15,"column":18,"endLine":15,"endColumn":23})"),
            std::string::npos);
  EXPECT_NE(json.out.find(R"({"name":"Clamp","kind":"function",)"), std::string::npos) << json.out;
  EXPECT_EQ(std::count(json.out.begin(), json.out.end(), '\n'), 2);

  Result rename = Vexil("lsp -- clangd --log=error --rename main.cpp:15:18:Limit");
  EXPECT_EQ(rename.status, 0);
  EXPECT_NE(rename.out.find("-  return shapes::Clamp(rectangle.Area(), 0, 100) == 48 ? 0 : 1;\n"
                            "+  return shapes::Limit(rectangle.Area(), 0, 100) == 48 ? 0 : 1;\n"),
            std::string::npos)
      << rename.out;
  EXPECT_NE(rename.err.find("vexil: note: clangd proposed edits only in files it has opened"), std::string::npos);
}

// Neither server offers pulled diagnostics, so the command waits for the publication; once
// stored, that is the answer at once, whatever the time-out. Columns are bytes, as clang's.
TEST(CommandLine, LspPrintsDiagnosticsInTheCompilersFormatWithByteColumns) {
  const vexil_test::TempDirectory directory;
  const std::string python = directory / "broken.py";
  const std::string cpp = directory / "broken.cpp";
  { std::ofstream(python) << "import os\n\nprint(undefined_name)\n"; }
  { std::ofstream(cpp) << "int main() {\n  const char* s = \"\xC3\xA9t\xC3\xA9\"; return undefined_name; }\n"; }
  Result run = Vexil("lsp --timeout=60000 -- pylsp --hover " + python + ":3:1 --diagnostics " + python);
  EXPECT_EQ(run.status, 0) << run.err;
  EXPECT_NE(run.out.find(python + ":3:7: error: undefined name 'undefined_name' [pyflakes]\n"), std::string::npos)
      << run.out;
  EXPECT_NE(run.out.find(python + ":1:1: warning: 'os' imported but unused [pyflakes]\n"), std::string::npos) << run.out;
  EXPECT_LT(run.seconds, 30) << "waited for a publication already stored";
  Result clangd = Vexil("lsp -- clangd --log=error --diagnostics " + cpp);
  EXPECT_NE(clangd.out.find(cpp + ":2:35: error: Use of undeclared identifier 'undefined_name' [clang "), std::string::npos)
      << clangd.out;

  // --watch: pylsp lints open files again when its configuration changes on disk, with no
  // didChange; SIGTERM then shuts it down.
  const std::string waitFor = "for i in $(seq 300); do grep -q \"$1\" \"$2\" && break; sleep 0.1; done";
  Result watch = Shell(
      "until_in() { " + waitFor + "; }; cd \"$SCRATCH\"; printf '[pycodestyle]\\nmax-line-length = 120\\n' > setup.cfg; "
      "echo \"x = '$(printf '%0100d' 0)'\" > long.py; "
      "\"$VEXIL\" lsp --watch --trace=messages --timeout=60000 -- pylsp --diagnostics long.py >w.out 2>w.err & pid=$!; "
      "until_in 'Ctrl-C ends' w.err; printf '[pycodestyle]\\nmax-line-length = 79\\n' > setup.cfg; "
      "until_in E501 w.out; kill -TERM $pid; wait $pid; echo \"status=$?\"; cat w.out w.err");
  EXPECT_EQ(watch.out.find("status=143\ndiagnostics long.py\n  (none)\ndiagnostics long.py\n"
                           "long.py:1:80: warning: E501 line too long (106 > 79 characters) [pycodestyle E501]\n"),
            0u)
      << watch.out;
  EXPECT_NE(watch.out.find(R"("method":"workspace/didChangeWatchedFiles","params":{"changes":[{"uri":"file://)"),
            std::string::npos);
  EXPECT_EQ(watch.out.find("textDocument/didChange\""), std::string::npos);
  EXPECT_NE(watch.out.find(R"("method":"shutdown")"), std::string::npos);
}

// Every failure is one line on stderr with its exit status; a program that is no server
// is told within seconds, not after the time-out.
TEST(CommandLine, FailuresAreOneLineWithTheirExitStatus) {
  const vexil_test::TempDirectory directory;
  { std::ofstream(directory / "latin.cpp") << "int caf\xE9 = 1;\n"; }
  struct Case {
    std::string arguments;
    int status;
    std::string line;  // the beginning of the one line on stderr
  };
  const std::string details = " (rerun with --trace verbose for details)\n";
  const Case cases[] = {
      {"lsp -- clangd --hover nosuch.cpp:1:1", 1, "vexil: nosuch.cpp: No such file or directory\n"},
      {"lsp --timeout=60000 -- yes --hover main.cpp:1:1", 1, "vexil: yes does not speak the language server protocol" + details},
      {"lsp --timeout=60000 -- cat --hover main.cpp:1:1", 1, "vexil: cat does not speak the language server protocol" + details},
      {"lsp -- clangd --json --hover main.cpp:1:1", 1, "vexil: clangd exited with status 1: "},
      {"lsp -- vexil-no-such-server --hover main.cpp:1:1", 1,
       "vexil: vexil-no-such-server did not start: Cannot find executable: vexil-no-such-server" + details},
      {"lsp --root=../python -- pylsp --workspace-symbols x", 1,
       "vexil: workspace-symbols x: pylsp does not support workspace/symbol\n"},
      {"lsp -- clangd --open " + (directory / "latin.cpp"), 1, "vexil: " + (directory / "latin.cpp") +
       ": not UTF-8 text (line 1, column 8)"},
      {"lsp -- clangd --hover main.cpp:0:1", 2, "vexil: LINE must be a positive number, not '0'. Try 'vexil lsp --help'\n"},
      {"lsp --json=yes -- clangd --open main.cpp", 2, "vexil: option '--json' takes no value. Try 'vexil lsp --help'\n"},
      {"task --run x /tmp", 2, "vexil: task needs --ext. Try 'vexil task --help'\n"},
      {"frobnicate", 2, "vexil: unknown command 'frobnicate'. Try 'vexil --help'\n"},
  };
  for (const Case& test : cases) {
    Result run = Vexil(test.arguments);
    EXPECT_EQ(run.status, test.status) << test.arguments << "\n" << run.err;
    EXPECT_EQ(run.err.rfind(test.line, 0), 0u) << test.arguments << "\n" << run.err;
    EXPECT_EQ(std::count(run.err.begin(), run.err.end(), '\n'), 1) << test.arguments << "\n" << run.err;
    EXPECT_LT(run.seconds, 30) << test.arguments;
  }
  Result json = Vexil("lsp --json -- vexil-no-such-server --hover main.cpp:1:1");
  EXPECT_EQ(json.out.rfind(R"({"action":"start","failed":true,"error":"vexil-no-such-server did not start: )", 0), 0u)
      << json.out;
  for (const char* help : {"--help", "lsp --help", "watch --help", "task --help", "demo --help"}) {
    Result run = Vexil(help);
    EXPECT_EQ(run.status, 0) << help;
    EXPECT_EQ(run.out.rfind("Usage: vexil ", 0), 0u) << help << "\n" << run.out;
  }
  EXPECT_EQ(Vexil("--version").out.rfind("vexil ", 0), 0u);
}

// Ctrl-C or SIGTERM ends what the command started and the command itself, with 128 + the
// signal: a server held in a request, a task's running command.
TEST(CommandLine, InterruptsEndTheCommandAndWhatItStarted) {
  const std::string awaitChild =
      "for i in $(seq 300); do child=$(pgrep -P $pid | head -n1); [ -n \"$child\" ] && break; sleep 0.1; done; ";
  const std::string report = "wait $pid; echo \"status=$?\"; sleep 0.2; kill -0 $child 2>/dev/null || echo gone; ";
  Result lsp = Shell("\"$VEXIL\" lsp --timeout=60000 -- \"$FAKE\" late=textDocument/hover:60000 --hover main.cpp:1:1 & "
                  "pid=$!; " + awaitChild + "sleep 0.5; kill -TERM $pid; " + report);
  EXPECT_NE(lsp.out.find("status=143\ngone\n"), std::string::npos) << lsp.out << lsp.err;

  // The task's command outlives the edit that started it; Ctrl-C ends both.
  Result task = Shell("echo x > \"$SCRATCH/a.cpp\"; "
                   "\"$VEXIL\" task --ext=cpp --run 'sleep 60' \"$SCRATCH\" & pid=$!; "
                   "for i in $(seq 300); do echo y >> \"$SCRATCH/a.cpp\"; "
                   "child=$(pgrep -P $pid | head -n1); [ -n \"$child\" ] && break; sleep 0.1; done; "
                   "kill -INT $pid; " + report);
  EXPECT_NE(task.out.find("status=130\ngone\n"), std::string::npos) << task.out << task.err;
  EXPECT_NE(task.err.find("vexil: task released\n"), std::string::npos) << task.err;
}

// Without --shell the command line is split into words and run directly, in --dir; every
// run ends with its exit status.
TEST(CommandLine, TaskRunsItsSplitCommandInItsDirectoryAndShowsTheExitStatus) {
  const std::string script =
      "mkdir \"$SCRATCH/src\" \"$SCRATCH/work\"; echo x > \"$SCRATCH/src/a b.cpp\"; "
      "\"$VEXIL\" task --ext cpp --dir=\"$SCRATCH/work\" --run 'sh -c \"pwd; echo hit \\\"$1\\\"; exit 3\" - $F' "
      "\"$SCRATCH/src\" 2> \"$SCRATCH/log\" & pid=$!; "
      "for i in $(seq 150); do echo y >> \"$SCRATCH/src/a b.cpp\"; "
      "grep -q 'exit status 3' \"$SCRATCH/log\" && break; sleep 0.2; done; "
      "kill -INT $pid; wait $pid; cat \"$SCRATCH/log\"";
  Result run = Shell(script);
  EXPECT_NE(run.out.find("Message: hit a b.cpp\n"), std::string::npos) << run.out;
  EXPECT_NE(run.out.find("/work\n"), std::string::npos) << run.out;
  EXPECT_NE(run.out.find("Message: vexil: exit status 3\n"), std::string::npos) << run.out;
}

}  // namespace

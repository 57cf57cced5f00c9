// `vexil` run as a program, the way people use it, in the C++ example against clangd and
// pylsp: what it prints for people and as JSON Lines, its one-line failures with their
// exit status, and its end on an interrupt with nothing of it left running.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <chrono>
#include <cstdio>
#include <fstream>
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
  run.out = vexil_test::ReadFile(scratch / "out");
  run.err = vexil_test::ReadFile(scratch / "err");
  return run;
}

Result Vexil(const std::string& arguments) { return Shell("\"$VEXIL\" " + arguments); }

// A protocol range as JSON text.
std::string Range(int line, int character, int endLine, int endCharacter) {
  return R"({"start":{"line":)" + std::to_string(line) + R"(,"character":)" + std::to_string(character) +
         R"(},"end":{"line":)" + std::to_string(endLine) + R"(,"character":)" + std::to_string(endCharacter) + "}}";
}

// One clangd run for every action printed for people, in the order given: what the server
// supports, a request of any method, the typed calls with their source lines and byte columns.
TEST(CommandLine, LspPrintsEachAnswerInItsPlaceForPeople) {
  Result run = Shell(R"("$VEXIL" lsp -- clangd --log=error --capabilities --open main.cpp --request )"
                     R"(textDocument/documentHighlight "{\"textDocument\":{\"uri\":\"file://$PWD/main.cpp\"},)"
                     R"(\"position\":{\"line\":14,\"character\":17}}" --definition main.cpp:15:18 )"
                     R"(--completion main.cpp:13:13 --highlight main.cpp:11:22 --prepare-rename main.cpp:15:18 )"
                     R"(--selection-range main.cpp:15:18 --semantic-tokens shapes.h --call-hierarchy shapes.cpp:17:5)");
  EXPECT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(run.out.rfind("capabilities\n", 0), 0u) << run.out;
  e2e::ExpectHas(
      run.out,
      {"\n  documentHighlightProvider\n", "\n  textDocumentSync: incremental changes, open and close, save\n",
       "request textDocument/documentHighlight\n  [{", R"("start":{"character":17,"line":14}})",
       "definition main.cpp:15:18\n  shapes.h:28:5: int Clamp(int value, int low, int high);\n",
       "\n  Area() const  : int\n", "\n  Perimeter() const  : int\n", "\n  Scale(int factor)  : void\n",
       "highlight main.cpp:11:22\n  main.cpp:11:21: text: shapes::Rectangle rectangle(3, 4);\n  main.cpp:12:10: text: ",
       "prepare-rename main.cpp:15:18\n  15:18-15:23: Clamp\n",
       "selection-range main.cpp:15:18\n  15:10-15:23: shapes::Clamp\n",
       "\n  10:1-16:2: int main() { ...\nsemantic-tokens shapes.h\n",
       "\n  28:5 function [declaration, globalScope]: Clamp\n",
       "call-hierarchy shapes.cpp:17:5\n  function Clamp  shapes.cpp:17:5\n    called from:\n"
       "      method Scale  shapes.cpp:13:12  (2 calls)\n",
       "\n      function main  main.cpp:15:18\n"});
  // Files are found below --root, whatever the current directory.
  Result python = Vexil("lsp --root=../python -- pylsp --hover=main.py:2:22 --folding geometry.py --highlight main.py:12:7");
  EXPECT_EQ(python.status, 0) << python.err;
  EXPECT_EQ(python.err, "") << "pylsp reports progress unasked: shown only with --progress";
  EXPECT_EQ(python.out.rfind("hover main.py:2:22\n", 0), 0u) << python.out;
  e2e::ExpectHas(python.out, {"folding geometry.py\n  4-6: def clamp(value, low, high):\n  9-23: class Rectangle:\n",
                         "/python/main.py:2:33: write: from geometry import Rectangle, clamp\n",
                         "/python/main.py:12:7: read: print(clamp("});
}

TEST(CommandLine, LspWritesJsonLinesWithNamedKindsAndDiffsForRenames) {
  Result json = Vexil("lsp --json -- clangd --log=error --open shapes.h --references main.cpp:15:18 --symbols shapes.h");
  EXPECT_EQ(json.status, 0);
  EXPECT_EQ(json.out.rfind(R"({"action":"references","file":"main.cpp","line":15,"column":18,"failed":false,"result":[)", 0), 0u)
      << json.out;
  e2e::ExpectHas(json.out, {R"("path":")" VEXIL_EXAMPLES R"(/cpp/main.cpp","line":15,"column":18,"endLine":15,"endColumn":23})",
                       R"({"name":"Clamp","kind":"function",)"});
  EXPECT_EQ(std::count(json.out.begin(), json.out.end(), '\n'), 2);

  // A rename is shown and, only with --apply, written exactly as shown, and the server is
  // told of the new text; then the preferred quick fix of a diagnostic, after which the
  // server finds nothing wrong.
  Result edits = Shell("cp main.cpp shapes.h compile_flags.txt \"$SCRATCH\"; cd \"$SCRATCH\"; "
                       "\"$VEXIL\" lsp -- clangd --log=error --rename main.cpp:15:18:Limit && cmp main.cpp \"$OLDPWD/main.cpp\" && "
                       "echo unwritten && "
                       "\"$VEXIL\" lsp --apply -- clangd --log=error --rename main.cpp:15:18:Limit --diagnostics main.cpp && "
                       "sed s/Limit/Clamp/ main.cpp | cmp - \"$OLDPWD/main.cpp\" && cmp shapes.h \"$OLDPWD/shapes.h\" && "
                       "sed s/Clamp/Clam/ \"$OLDPWD/main.cpp\" > main.cpp && \"$VEXIL\" lsp --apply --json -- clangd "
                       "--log=error --code-actions main.cpp:15:18 --diagnostics main.cpp && cmp main.cpp \"$OLDPWD/main.cpp\"");
  EXPECT_EQ(edits.status, 0) << edits.out << edits.err;
  const std::string diff = "-  return shapes::Clamp(rectangle.Area(), 0, 100) == 48 ? 0 : 1;\n"
                           "+  return shapes::Limit(rectangle.Area(), 0, 100) == 48 ? 0 : 1;\n }\n";
  e2e::ExpectHas(edits.out, {diff + "unwritten\n", diff + "  written: main.cpp\n"
                        "diagnostics main.cpp\nmain.cpp:15:18: error: No member named 'Limit' in namespace 'shapes'",
                        R"({"title":"change 'Clam' to 'Clamp'","kind":"quickfix","preferred":true,"edits":[{"path":")",
                        R"(main.cpp","line":15,"column":18,"endLine":15,"endColumn":22,"newText":"Clamp"}],"applied":true})",
                        R"({"action":"diagnostics","file":"main.cpp","failed":false,"result":[]})"});
  e2e::ExpectHas(edits.err, {"vexil: note: clangd proposed edits only in files it has opened"});

  // What a server asks to apply is shown, and written only with --apply; an edit that
  // cannot be made writes nothing and fails the action.
  const std::string edit = R"({"range":)" + Range(0, 4, 0, 5) + R"(,"newText":"y"})";
  const std::string ask = R"('{"ask":[{"method":"workspace/applyEdit","params":{"edit":{"changes":{"'"file://$SCRATCH/a.cpp"'":[)";
  Result asked = Shell("echo 'int x = 1;' > \"$SCRATCH/a.cpp\"; for apply in '' --apply; do \"$VEXIL\" lsp $apply -- "
                       "\"$FAKE\" --request fake/x " + ask + edit + "]}}}}]}'; cat \"$SCRATCH/a.cpp\"; done; "
                       "\"$VEXIL\" lsp --apply -- \"$FAKE\" --request fake/x " + ask + edit + "," + edit + "]}}}}]}'; "
                       "status=$?; cat \"$SCRATCH/a.cpp\"; exit $status");
  EXPECT_EQ(asked.status, 1);
  e2e::ExpectHas(asked.out, {R"("result":{"applied":false,"failureReason":"vexil lsp writes edits only with --apply"}}])",
                        "  the server asked for edits:\n--- ", "-int x = 1;\n+int y = 1;\nint x = 1;\n",
                        R"("result":{"applied":true}}])", "  written: "});
  EXPECT_TRUE(e2e::EndsWith(asked.out, "int y = 1;\nint y = 1;\n")) << asked.out;
  e2e::ExpectHas(asked.err, {"vexil: request fake/x: the server asked for edits: nothing written: Cannot edit "});

  // --apply=N takes the Nth code action, a number never a title; without a choice, two
  // actions none of which is preferred write nothing.
  auto action = [](const std::string& title, const std::string& text) {
    return R"({"title":")" + title + R"(","edit":{"changes":{"'"file://$SCRATCH/c.cpp"'":[{"range":)" + Range(0, 4, 0, 5) +
           R"(,"newText":")" + text + R"("}]}}})";
  };
  const std::string actions = "'result=textDocument/codeAction:[" + action("Use 2", "b") + "," + action("second", "c") + "]'";
  Result chosen = Shell("echo 'int a;' > \"$SCRATCH/c.cpp\"; \"$VEXIL\" lsp --apply -- \"$FAKE\" diagnose " + actions +
                        " --code-actions \"$SCRATCH/c.cpp:1:5\"; cat \"$SCRATCH/c.cpp\"; \"$VEXIL\" lsp --apply=2 -- \"$FAKE\" "
                        "diagnose " + actions + " --code-actions \"$SCRATCH/c.cpp:1:5\" && cat \"$SCRATCH/c.cpp\"");
  EXPECT_EQ(chosen.status, 0) << chosen.err;
  e2e::ExpectHas(chosen.err, {": none of the code actions is preferred; choose one with --apply=N: 1. Use 2; 2. second\n"});
  EXPECT_EQ(chosen.out.rfind("int a;\ncode-actions ", 0), 0u) << chosen.out;
  e2e::ExpectHas(chosen.out, {"* 2. second\n"});
  EXPECT_TRUE(e2e::EndsWith(chosen.out, "int c;\n")) << chosen.out;
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
  e2e::ExpectHas(run.out, {python + ":3:7: error: undefined name 'undefined_name' [pyflakes]\n",
                      python + ":1:1: warning: 'os' imported but unused [pyflakes]\n"});
  EXPECT_LT(run.seconds, 30) << "waited for a publication already stored";
  Result clangd = Vexil("lsp -- clangd --log=error --diagnostics " + cpp);
  e2e::ExpectHas(clangd.out, {cpp + ":2:35: error: Use of undeclared identifier 'undefined_name' [clang "});

  // --watch: pylsp lints open files again when its configuration changes on disk, with no
  // didChange; only the file whose diagnostics changed is printed again; SIGTERM then shuts
  // it down.
  const std::string waitFor = "for i in $(seq 300); do grep -q \"$1\" \"$2\" && break; sleep 0.1; done";
  Result watch = Shell(
      "until_in() { " + waitFor + "; }; cd \"$SCRATCH\"; printf '[pycodestyle]\\nmax-line-length = 120\\n' > setup.cfg; "
      "echo \"x = '$(printf '%0100d' 0)'\" > long.py; echo 'x = 1' > short.py; \"$VEXIL\" lsp --watch "
      "--trace=messages --timeout=60000 -- pylsp --diagnostics long.py --diagnostics short.py >w.out 2>w.err & pid=$!; "
      "until_in 'Ctrl-C ends' w.err; printf '[pycodestyle]\\nmax-line-length = 79\\n' > setup.cfg; "
      "until_in E501 w.out; kill -TERM $pid; wait $pid; echo \"status=$?\"; cat w.out w.err");
  EXPECT_EQ(watch.out.find("status=143\ndiagnostics long.py\n  (none)\ndiagnostics short.py\n  (none)\n"
                           "diagnostics long.py\nlong.py:1:80: warning: E501 line too long (106 > 79 characters) "
                           "[pycodestyle E501]\n"),
            0u)
      << watch.out;
  EXPECT_EQ(watch.out.find("diagnostics short.py", watch.out.find("E501")), std::string::npos) << watch.out;
  e2e::ExpectHas(watch.out, {R"("method":"workspace/didChangeWatchedFiles","params":{"changes":[{"uri":"file://)",
                        R"("method":"shutdown")"});
  EXPECT_EQ(watch.out.find("textDocument/didChange\""), std::string::npos);
}

// Every failure is one line on stderr with its exit status; a program that is no server
// is told within seconds, not after the time-out.
TEST(CommandLine, FailuresAreOneLineWithTheirExitStatus) {
  const vexil_test::TempDirectory directory;
  { std::ofstream(directory / "latin.cpp") << "int caf\xE9 = 1;\n"; }
  const std::string fine = directory / "fine.cpp";
  { std::ofstream(fine) << "int x = 1;\n"; }
  struct Case { std::string arguments; int status; std::string line; };  // line: how stderr begins
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
      {"lsp --root=../python -- pylsp --semantic-tokens main.py", 1,
       "vexil: semantic-tokens main.py: pylsp does not support textDocument/semanticTokens/full\n"},
      {"lsp -- clangd --execute clangd.applyFix '{}'", 2,
       "vexil: --execute: ARGUMENTS must be a JSON array, not '{}'. Try 'vexil lsp --help'\n"},
      // Overlapping edits: nothing is written.
      {"lsp --apply -- \"$FAKE\" 'result=textDocument/formatting:[{\"range\":" + Range(0, 0, 0, 3) +
           ",\"newText\":\"a\"},{\"range\":" + Range(0, 2, 0, 4) + ",\"newText\":\"b\"}]' --format " + fine, 1,
       "vexil: format " + fine + ": nothing written: Cannot edit " + fine + ": Overlapping edits at 0:0-0:3 and 0:2-0:4\n"},
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
  EXPECT_EQ(vexil_test::ReadFile(fine), "int x = 1;\n");
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
  // The child's end is awaited: on a busy machine it is reaped some time after vexil's own.
  const std::string report =
      "wait $pid; echo \"status=$?\"; "
      "for i in $(seq 300); do kill -0 $child 2>/dev/null || { echo gone; break; }; sleep 0.1; done; ";
  Result lsp = Shell("\"$VEXIL\" lsp --timeout=60000 -- \"$FAKE\" late=textDocument/hover:60000 --hover main.cpp:1:1 & "
                  "pid=$!; " + awaitChild + "sleep 0.5; kill -TERM $pid; " + report);
  e2e::ExpectHas(lsp.out + lsp.err, {"status=143\ngone\n"});

  // The task's command outlives the edit that started it; Ctrl-C ends both.
  Result task = Shell("echo x > \"$SCRATCH/a.cpp\"; "
                   "\"$VEXIL\" task --ext=cpp --run 'sleep 60' \"$SCRATCH\" & pid=$!; "
                   "for i in $(seq 300); do echo y >> \"$SCRATCH/a.cpp\"; "
                   "child=$(pgrep -P $pid | head -n1); [ -n \"$child\" ] && break; sleep 0.1; done; "
                   "kill -INT $pid; " + report);
  e2e::ExpectHas(task.out + task.err, {"status=130\ngone\n", "vexil: task released\n"});
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
  e2e::ExpectHas(run.out, {"Message: hit a b.cpp\n", "/work\n", "Message: vexil: exit status 3\n"});
}

}  // namespace

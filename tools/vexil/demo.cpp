// `vexil demo`: runs the four tours in turn and turns the first failed check into one
// line and exit status 1.
#include "demo.h"

#include <cstdio>
#include <filesystem>

#include "commands.h"
#include "options.h"
#include "session.h"
#include "text_edits.h"
#include "trace_sink.h"

namespace cli {

void Report(const std::string& what, const std::string& result) {
  std::printf("  %-30s %s\n", what.c_str(), result.c_str());
  std::fflush(stdout);
}

void Expect(bool condition, const std::string& explanation) {
  if (!condition) throw DemoFailure(explanation);
}

std::string Elapsed(std::chrono::steady_clock::time_point start) {
  double seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  char text[32];
  std::snprintf(text, sizeof text, "%.2f s", seconds);
  return text;
}

Action At(ActionKind kind, const std::string& path, const std::string& needle, std::size_t offset) {
  Action action;
  action.kind = kind;
  action.file = action.path = path;
  std::vector<std::string> lines = SplitLines(ReadText(path));
  for (std::size_t line = 0; line < lines.size(); ++line) {
    std::size_t at = lines[line].find(needle);
    if (at == std::string::npos) continue;
    action.line = static_cast<int>(line) + 1;
    action.column = static_cast<int>(at + offset) + 1;
    return action;
  }
  throw DemoFailure("the example " + path + " no longer contains '" + needle + "'");
}

int LineOf(const std::string& path, const std::string& needle) {
  try {
    return At(ActionKind::Hover, path, needle, 0).line;
  } catch (const DemoFailure&) {
    return 0;
  }
}

std::string DemoHelp() {
  return "Usage: vexil demo [--examples=DIR]\n"
         "Show the library driving clangd over DIR/cpp and pylsp over DIR/python (hover, definition,\n"
         "references, completion, symbols, formatting, rename), then a workspace watcher and a\n"
         "watcher task over a temporary directory. DIR defaults to the source tree's examples.\n";
}

int RunDemo(const Arguments& arguments) {
  std::string examples = VEXIL_EXAMPLES;
  OptionReader reader(arguments);
  while (!reader.Done()) {
    if (reader.Is("--examples")) examples = reader.Value();
    else reader.Unknown();
  }
  examples = AbsolutePath(examples);
  ShowTrace(LSP::TraceLevel::Off);  // failures are explained by the checks; the trace would drown them
  auto start = std::chrono::steady_clock::now();
  std::printf("vexil demo: the library driving real language servers and a directory watcher\n");
  try {
    DemoClangd(examples);
    DemoPylsp(examples);
    DemoWatcher();
    DemoTask();
  } catch (const DemoFailure& failure) {
    std::fflush(stdout);
    std::fprintf(stderr, "vexil demo failed: %s\n", failure.what());
    return 1;
  }
  std::printf("\nvexil demo: every step gave what it should, in %s\n", Elapsed(start).c_str());
  return 0;
}

}  // namespace cli

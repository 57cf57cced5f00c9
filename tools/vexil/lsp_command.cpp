// `vexil lsp`: checks the files, starts one server, performs the actions in order, prints
// each answer, and ends the server. Any failure makes the exit status 1; an interrupt
// ends the server with it.
#include <chrono>
#include <iostream>
#include <map>
#include <sstream>
#include <thread>

#include "commands.h"
#include "host_process.h"
#include "lsp_options.h"
#include "render.h"
#include "server_messages.h"
#include "trace_sink.h"
#include "vexil/client/uri.h"

namespace cli {
namespace {

constexpr const char* kDetails = " (rerun with --trace verbose for details)";

// A failure before any answer, in the form asked for.
int Fail(const LspOptions& options, const std::string& action, const std::string& why) {
  if (options.json) PrintJsonError(std::cout, action, why);
  std::cout.flush();
  std::cerr << "vexil: " << why << "\n";
  return 1;
}

// Servers rename only what they know: with no index, the files they have opened.
void NoteOpenOnly(Session& session, const Outcome& outcome) {
  for (const FileEdits& file : outcome.edits)
    if (!session.IsOpen(file.path)) return;
  std::cerr << "vexil: note: " << session.Program() << " proposed edits only in files it has opened; "
            << "files it has not indexed are not included (open them first with --open)\n";
}

// The answer to `action` in the form asked for; a failure has no readable answer (its
// line goes to stderr).
std::string Rendered(const LspOptions& options, const Action& action, const Outcome& outcome) {
  std::ostringstream text;
  if (options.json) PrintJson(text, action, outcome);
  else if (!outcome.failed) PrintReadable(text, action, outcome);
  return text.str();
}

// The file's diagnostics as --diagnostics prints them.
std::string DiagnosticsText(xLanguageServer& server, const LspOptions& options, const Action& action) {
  Outcome outcome;
  outcome.diagnostics = server.TextDocument_Diagnostics(FileToUri(action.path.c_str()).c_str());
  return Rendered(options, action, outcome);
}

// --watch: the session stays open while the library tells the server about files changed
// on disk; a file's diagnostics asked for are printed again whenever they differ from
// `printed`, what was printed of them last. An interrupt ends it, the server shut down first.
int WatchUntilInterrupted(Session& session, const LspOptions& options, std::map<const Action*, std::string>& printed) {
  constexpr std::chrono::milliseconds kTick{200};
  WindUpChildren();
  std::cerr << "vexil: telling " << session.Program() << " about changes under " << options.session.root
            << "; Ctrl-C ends\n";
  xLanguageServer& server = session.Server();
  int version = server.DiagnosticsVersion();
  while (!Interrupted() && server.IsRunning()) {
    std::this_thread::sleep_for(kTick);
    const int now = server.DiagnosticsVersion();
    if (now == version) continue;
    version = now;
    for (auto& [action, last] : printed) {
      std::string text = DiagnosticsText(server, options, *action);
      if (text == last) continue;
      std::cout << text << std::flush;
      last = std::move(text);
    }
  }
  if (!Interrupted()) return Fail(options, "watch", session.Program() + " exited" + (LastExit().empty() ? "" : " with " + LastExit()));
  if (!session.Stop()) EndChildren();
  return 128 + Interrupted();
}

}  // namespace

std::string LspHelp() {
  std::string text =
      "Usage: vexil lsp [OPTION]... -- SERVER [ARG]... ACTION...\n"
      "Start the language server SERVER (with up to seven ARGs), perform the actions in order,\n"
      "print each answer, then end the server.\n"
      "\n"
      "Options:\n"
      "  --root=DIR        workspace root, the server's directory and the base of relative FILEs\n"
      "                    (default: the current directory)\n"
      "  --timeout=MS      wait for each answer (default 5000; initialize waits at least 10000)\n"
      "  --language=ID     language id of every file, instead of the one its extension gives\n"
      "  --json            one JSON object per answer and per failure (JSON Lines)\n"
      "  --trace=LEVEL     show the library's trace on stderr: off, messages or verbose\n"
      "  --env=NAME=VALUE  set a variable of the server's environment (repeatable)\n"
      "  --progress        announce work-done progress, and show the server's on stderr\n"
      "  --watch           after the actions (none needed), tell the server about files changed\n"
      "                    under the root and print --diagnostics again as they change, until Ctrl-C\n"
      "  --apply[=CHOICE]  write the edits of renames, formatting and code actions to the files,\n"
      "                    and those the server asks for (without it they are only shown); a\n"
      "                    code action is the preferred or only one, or CHOICE: its number or\n"
      "                    words of its title\n"
      "  --help            show this help\n"
      "\n"
      "Actions (lines and columns count from 1, columns in bytes):\n";
  for (const ActionInfo& info : Actions()) {
    std::string left = std::string("  ") + info.option + " " + OperandForm(info.operand);
    text += left + std::string(left.size() < 42 ? 42 - left.size() : 1, ' ') + info.help + "\n";
  }
  return text +
         "A file is opened before its first action. The server's messages and log lines are shown\n"
         "on stderr. Exit status: 0 success, 1 a file, the server or an action failed, 2 bad usage,\n"
         "130 or 143 when interrupted.\n";
}

int RunLsp(const Arguments& arguments) {
  LspOptions options = ParseLspOptions(arguments);
  ShowTrace(options.session.trace);
  if (FileToUri(options.session.root.c_str()).empty()) {
    return Fail(options, "start", options.session.root + ": the root cannot be written as a file URI");
  }
  for (const Action& action : options.actions) {
    if (action.file.empty()) continue;
    try {
      CheckDocument(action.path, action.file);
    } catch (const Failure& failure) {
      return Fail(options, std::string(InfoOf(action.kind).option).substr(2), failure.what());
    }
  }
  Session session(options.session);
  std::string why;
  if (!session.Start(why)) {
    if (Interrupted()) return 128 + Interrupted();
    if (options.session.trace != LSP::TraceLevel::Verbose) why += kDetails;
    return Fail(options, "start", why);
  }
  int status = 0;
  std::map<const Action*, std::string> printed;  // of the --diagnostics actions, for --watch
  for (const Action& action : options.actions) {
    if (Interrupted()) break;
    Outcome outcome = Perform(session, action);
    if (Interrupted()) break;
    EndProgressLine();  // an answer on the same terminal starts at the margin
    const std::string text = Rendered(options, action, outcome);
    std::cout << text << std::flush;
    if (action.kind == ActionKind::Diagnostics) printed[&action] = text;
    if (outcome.failed) {
      status = 1;
      std::cerr << "vexil: " << Describe(action) << ": " << outcome.why << "\n";
    } else if (action.kind == ActionKind::Rename && !outcome.edits.empty()) {
      NoteOpenOnly(session, outcome);
    }
    if (outcome.applied) {
      AfterWriting(session, outcome.edits);
      AfterWriting(session, outcome.requested);
    }
  }
  if (Interrupted()) return 128 + Interrupted();
  if (options.session.watch) return WatchUntilInterrupted(session, options, printed);
  // The library waits about a second for the server to end; the answers are in, and a
  // slower server is ended rather than left running.
  if (!session.Stop()) EndChildren();
  return status;
}

}  // namespace cli

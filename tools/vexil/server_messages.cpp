// The command-line host's message handler. It runs on the connection's dispatch thread,
// so what it prints is kept whole by a lock of its own.
#include "server_messages.h"

#include <cstdio>
#include <map>
#include <mutex>
#include <string>

#include "apply.h"
#include "host_process.h"
#include "session.h"
#include "vexil/json/json.h"

namespace cli {
namespace {

std::mutex printing;
std::size_t progressWidth = 0;  // of the progress line on the terminal; 0 when none is shown
std::map<std::string, std::string> titles;  // of the progress under way, by token

// The protocol's message types, from 1.
const char* TypeName(int type) {
  static const char* const names[] = {"error", "warning", "info", "log"};
  return type >= 1 && type <= 4 ? names[type - 1] : "log";
}

// `text` on one line: line breaks become blanks.
std::string OneLine(std::string text) {
  for (char& c : text) {
    if (c == '\n' || c == '\r') c = ' ';
  }
  while (!text.empty() && text.back() == ' ') text.pop_back();
  return text;
}

// Under the lock: blanks out the progress line, so that other text starts at the margin.
void ClearProgressLine() {
  if (progressWidth == 0) return;
  std::fprintf(stderr, "\r%s\r", std::string(progressWidth, ' ').c_str());
  progressWidth = 0;
}

std::string TokenOf(const LSP::xObject& params) {
  LSP::xObject token = params.Object("token");
  return token.IsString() ? token.GetString() : std::to_string(token.AsInt(0));
}

// Under the lock: "title: message 40%" of a progress report, the title given when it began;
// its kind ("begin", "report", "end") in `kind`.
std::string ProgressText(const LSP::xObject& params, std::string& kind) {
  LSP::xObject value = params.Object("value");
  kind = value.String("kind");
  std::string token = TokenOf(params);
  if (kind == "begin") titles[token] = value.String("title");
  std::string text = titles[token];
  if (kind == "end") titles.erase(token);
  std::string message = value.String("message");
  if (!message.empty()) text += (text.empty() ? "" : ": ") + message;
  if (value.HasObject("percentage")) text += " " + std::to_string(value.Int("percentage")) + "%";
  if (kind == "end") text += text.empty() ? "done" : ": done";
  return OneLine(text);
}

void ShowProgress(const std::string& program, const LSP::xObject& params) {
  std::lock_guard<std::mutex> lock(printing);
  std::string kind;
  std::string text = "vexil: " + program + ": " + ProgressText(params, kind);
  if (!ErrorsToTerminal()) {
    std::fprintf(stderr, "%s\n", text.c_str());
    return;
  }
  ClearProgressLine();
  if (kind == "end") return;
  std::fprintf(stderr, "%s", text.c_str());
  std::fflush(stderr);
  progressWidth = text.size();
}

void ShowMessage(const std::string& program, const LSP::xObject& params) {
  std::string text = OneLine(params.String("message"));
  std::lock_guard<std::mutex> lock(printing);
  ClearProgressLine();
  std::fprintf(stderr, "vexil: %s: %s: %s\n", program.c_str(), TypeName(params.Int("type")), text.c_str());
}

}  // namespace

void ShowServerMessage(void* user, const char* method, const char* idJson, const char* paramsJson) {
  Session& session = *static_cast<Session*>(user);
  std::string name = method;
  if (idJson && name == "workspace/applyEdit") return AnswerApplyEdit(session.Server(), session.Applies(), idJson, paramsJson);
  // The other request routed here is a progress token's (with --progress): granted.
  if (idJson) session.Server().Reply(idJson, "null");
  LSP::xReader reader;
  if (!reader.Parse(paramsJson) || !reader.Root().IsObject()) return;
  try {
    // Some servers (pylsp) report progress nobody asked for: shown only with --progress.
    if (name == "$/progress" && session.ShowsProgress()) ShowProgress(session.Program(), reader.Root());
    if (name == "window/showMessage" || name == "window/logMessage") ShowMessage(session.Program(), reader.Root());
  } catch (const std::exception&) {
    // A malformed message of the server is not worth a line.
  }
}

void EndProgressLine() {
  std::lock_guard<std::mutex> lock(printing);
  ClearProgressLine();
}

}  // namespace cli

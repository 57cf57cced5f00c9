// Helpers for the end-to-end tests: start records for clangd and pylsp, the example
// projects' files, positions found by the text at them, and an error-line recorder.
#pragma once

#include <signal.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <fstream>
#include <regex>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "vexil/client/languages.h"
#include "vexil/client/uri.h"
#include "vexil/host/language_server.h"

namespace e2e {

// Real servers on a loaded machine (and under sanitizers) get a generous wait.
constexpr int kTimeoutMs = 15000;

// Counts the "Error" lines a connection traces; reader threads may report too.
class ErrorLines {
 public:
  static void Callback(TraceType type, const char* title, const char* text) {
    if (std::string(title) == "Error") ++count_;
  }
  static int Count() { return count_; }

 private:
  static inline std::atomic<int> count_{0};
};

struct Project {
  std::string directory;  // absolute
  std::string executable;
  std::string argument;
};

inline Project Cpp() { return {VEXIL_EXAMPLES "/cpp", "clangd", "--log=error"}; }
inline Project Python() { return {VEXIL_EXAMPLES "/python", "pylsp", ""}; }

inline xServerStart StartRecord(const Project& project, const std::string& name) {
  xServerStart start;
  start.trace = &ErrorLines::Callback;
  start.level = LSP::TraceLevel::Off;
  start.timeout = kTimeoutMs;
  start.executable = project.executable;
  start.argument1 = project.argument;
  start.directory = project.directory;
  start.name = name;
  return start;
}

inline xServerInitialise InitRecord(const Project& project) {
  xServerInitialise init;
  init.processId = static_cast<int>(::getpid());
  init.rootPath = project.directory;
  init.workspaceFolders.emplace_back(FileToUri(project.directory.c_str()), "examples");
  return init;
}

inline std::string Path(const Project& project, const std::string& file) { return project.directory + "/" + file; }
inline std::string Uri(const Project& project, const std::string& file) { return FileToUri(Path(project, file).c_str()); }

inline std::string ReadFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

// The position `offset` bytes into the first occurrence of `needle` in `file`.
inline LSP::Position Find(const Project& project, const std::string& file, const std::string& needle,
                          std::size_t offset = 0) {
  std::string text = ReadFile(Path(project, file));
  std::size_t at = text.find(needle);
  if (at == std::string::npos) return LSP::Position(-1, -1);
  at += offset;
  std::size_t lineStart = text.rfind('\n', at == 0 ? 0 : at - 1);
  lineStart = lineStart == std::string::npos ? 0 : lineStart + 1;
  return LSP::Position(static_cast<int>(std::count(text.begin(), text.begin() + static_cast<long>(at), '\n')),
                       static_cast<int>(at - lineStart));
}

// The zero-based line of the first occurrence of `needle` in `file`.
inline int LineOf(const Project& project, const std::string& file, const std::string& needle) {
  return Find(project, file, needle).line;
}

inline void Open(xLanguageServer& server, const Project& project, const std::string& file) {
  static const xLanguages languages;
  LSP::DidOpenTextDocumentParams params;
  params.textDocument.uri = Uri(project, file);
  params.textDocument.languageId = languages.LanguageId(file.substr(file.rfind('.') + 1).c_str());
  params.textDocument.version = 1;
  params.textDocument.text = ReadFile(Path(project, file));
  server.TextDocument_DidOpen(&params);
}

template <typename P = LSP::TextDocumentPositionParams>
P At(const Project& project, const std::string& file, const LSP::Position& position) {
  P params;
  params.textDocument.uri = Uri(project, file);
  params.position = position;
  return params;
}

// The start lines of the ranges in `json` (a result as JSON text), in order.
inline std::vector<int> StartLines(const std::string& json) {
  static const std::regex start(R"("start":\{[^}]*"line":(\d+))");
  std::vector<int> lines;
  for (auto match = std::sregex_iterator(json.begin(), json.end(), start); match != std::sregex_iterator(); ++match) {
    lines.push_back(std::stoi((*match)[1]));
  }
  return lines;
}

inline bool EndsWith(const std::string& text, const std::string& end) {
  return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

// Kills a server this test started, by its process id, and waits until it is gone.
inline bool Kill(xLanguageServer& server) {
  if (server.Id() > 0) ::kill(server.Id(), SIGKILL);
  auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  while (server.IsRunning()) {
    if (std::chrono::steady_clock::now() > deadline) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return true;
}

// Exit gives a server about a second to end and, when it has not, returns false and leaves
// the connection usable: on a loaded machine a host (and a test) asks again.
inline bool Exits(xLanguageServer& server) {
  auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(30);
  while (!server.Exit()) {
    if (std::chrono::steady_clock::now() > deadline) return false;
  }
  return true;
}

}  // namespace e2e

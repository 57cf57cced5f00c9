// Helpers for the end-to-end tests: start records for clangd and pylsp that trace into the
// shared trace log, the example projects' files and positions found by the text at them.
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <map>
#include <string>
#include <vector>

#include "vexil/client/languages.h"
#include "vexil/client/uri.h"
#include "vexil/host/language_server.h"
#include "vexil_test/support.h"
#include "vexil_test/trace_log.h"

namespace e2e {

// Real servers on a loaded machine (and under sanitizers) get a generous wait.
constexpr int kTimeoutMs = 15000;
// How long a test waits for what a real server does in the background (indexing, progress).
constexpr std::chrono::seconds kPatience{60};

struct Project {
  std::string directory;  // absolute
  std::string executable;
  std::string argument;
};

inline Project Cpp() { return {VEXIL_EXAMPLES "/cpp", "clangd", "--log=error"}; }
inline Project Python() { return {VEXIL_EXAMPLES "/python", "pylsp", ""}; }

inline xServerStart StartRecord(const Project& project, const std::string& name) {
  xServerStart start;
  start.trace = &vexil_test::TraceLog::Callback;
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

// The position `offset` bytes into the first occurrence of `needle` in `file`.
inline LSP::Position Find(const Project& project, const std::string& file, const std::string& needle,
                          std::size_t offset = 0) {
  std::string text = vexil_test::ReadFile(Path(project, file));
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

// Fails naming each of `pieces` that `text` lacks.
inline void ExpectHas(const std::string& text, std::initializer_list<std::string> pieces) {
  for (const std::string& piece : pieces) EXPECT_NE(text.find(piece), std::string::npos) << piece << "\n--- in:\n" << text;
}

// Opens `file` of `project` with what the file holds.
inline void Open(xLanguageServer& server, const Project& project, const std::string& file) {
  static const xLanguages languages;
  LSP::DidOpenTextDocumentParams params;
  params.textDocument.uri = Uri(project, file);
  params.textDocument.languageId = languages.LanguageId(file.substr(file.rfind('.') + 1).c_str());
  params.textDocument.version = 1;
  params.textDocument.text = vexil_test::ReadFile(Path(project, file));
  server.TextDocument_DidOpen(&params);
}

template <typename P = LSP::TextDocumentPositionParams>
P At(const Project& project, const std::string& file, const LSP::Position& position) {
  P params;
  params.textDocument.uri = Uri(project, file);
  params.position = position;
  return params;
}

// Params of a call about the whole of `file`.
template <typename P>
P Document(const Project& project, const std::string& file) {
  P params;
  params.textDocument.uri = Uri(project, file);
  return params;
}

// How many of `locations` lie in each file.
inline std::map<std::string, int> PerFile(const std::vector<LSP::Location>& locations) {
  std::map<std::string, int> count;
  for (const LSP::Location& location : locations) ++count[UriToFile(location.uri.c_str())];
  return count;
}

inline bool EndsWith(const std::string& text, const std::string& end) {
  return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

// Kills a server this test started, by its process id, and waits until it is gone.
inline bool Kill(xLanguageServer& server) {
  vexil_test::KillProcess(server.Id());
  return vexil_test::WaitFor([&] { return !server.IsRunning(); }, kPatience);
}

}  // namespace e2e

// Helpers for the connection tests: connections to the fake server made through the
// exports, and the messages the connection sent, taken from its "Sent" trace lines.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "transport_test_support.h"
#include "vexil/host/language_server.h"
#include "vexil_test/support.h"

namespace connection_test {

using transport_test::TraceLog;

// The JSON bodies of every message traced as sent, in order.
inline std::vector<std::string> SentBodies() {
  std::vector<std::string> bodies;
  for (const std::string& text : TraceLog::Texts("Message")) {
    if (text.rfind("\nSent: ", 0) != 0) continue;
    std::size_t body = text.find("\r\n\r\n") + 4;
    bodies.push_back(text.substr(body, text.size() - body - 1));
  }
  return bodies;
}

// The sent body whose method is `method`; empty when none was sent.
inline std::string SentBody(const std::string& method) {
  for (const std::string& body : SentBodies()) {
    if (body.find("\"method\":\"" + method + "\"") != std::string::npos) return body;
  }
  return "";
}

// Ends a connection a test left behind: its server is killed first, so Exit succeeds.
inline void Dispose(const std::string& name) {
  xLanguageServer* server = Vexil_Have(name.c_str());
  if (!server) return;
  vexil_test::KillProcess(server->Id());
  transport_test::WaitFor([&] { return !server->IsRunning(); });
  server->Exit();
}

// The fake server registered under `name` with these directives, not started yet.
inline xLanguageServer* Fake(const char* name, std::vector<std::string> directives = {}, int timeout = 2000,
                             LSP::TraceLevel level = LSP::TraceLevel::Messages) {
  xServerStart start = transport_test::FakeStart(std::move(directives), timeout, level);
  start.name = name;
  return Vexil_Start(start);
}

// Registers the fake server under `name` with these directives and starts it, at the
// messages level with a 2 s time-out; the trace starts empty after the start.
inline xLanguageServer* StartedFake(const char* name, std::vector<std::string> directives) {
  xLanguageServer* server = Fake(name, std::move(directives));
  EXPECT_TRUE(server->Start(xServerInitialise()));
  TraceLog::Clear();
  return server;
}

// The didOpen of `uri` at version 1 and the whole-text didChange to version 2.
inline LSP::DidOpenTextDocumentParams Opened(const char* uri, const std::string& text) {
  LSP::DidOpenTextDocumentParams params;
  params.textDocument.uri = uri;
  params.textDocument.languageId = "cpp";
  params.textDocument.version = 1;
  params.textDocument.text = text;
  return params;
}
inline LSP::DidChangeTextDocumentParams Changed(const char* uri, const std::string& text) {
  LSP::DidChangeTextDocumentParams params;
  params.textDocument = LSP::VersionedTextDocumentIdentifier(uri, 2);
  params.contentChanges.emplace_back();
  params.contentChanges.back().text = text;
  return params;
}

}  // namespace connection_test

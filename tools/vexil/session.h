// One language server as the command-line host uses it: launched and initialized through
// the library's exports, with the documents it has opened and their versions.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "vexil/client/languages.h"
#include "vexil/host/language_server.h"

namespace cli {

struct SessionOptions {
  std::string name;  // the registry name
  std::string program;
  std::vector<std::string> arguments;  // at most seven
  std::string root;                    // the workspace root and the server's directory
  int timeout = 5000;
  LSP::TraceLevel trace = LSP::TraceLevel::Off;
  std::string language;  // the language id of every document, instead of the table's
};

class Session {
 public:
  explicit Session(const SessionOptions& options);
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  // Stops the server if that has not been tried.
  ~Session();

  // Launches and initializes the server; false when either failed (see Failure).
  bool Start();
  // Shutdown and exit; false when the server would not end.
  bool Stop();
  xLanguageServer& Server() { return *server_; }

  // The URI of `path`, opened first (didOpen with its text) unless it is open.
  std::string Document(const std::string& path);
  // Sends the file's current text as a new version.
  void Change(const std::string& path);
  void Save(const std::string& path);
  void Close(const std::string& path);
  // The language id a document of `path` is opened with; "" when none is known.
  std::string LanguageOf(const std::string& path) const;
  // The reply time-out in milliseconds.
  int Timeout() const { return options_.timeout; }

  // Marks the start of an operation, and afterwards tells whether it failed and why:
  // the server's error state, or else the first error line traced since the mark.
  void Mark();
  bool Failed(std::string& why);

 private:
  SessionOptions options_;
  xLanguageServer* server_;
  std::map<std::string, int> versions_;  // open documents by URI
  int errorMark_ = 0;
  bool stopTried_ = false;  // a server that would not end is not waited for twice
};

// `path` made absolute and normal, as documents are named.
std::string AbsolutePath(const std::string& path);
std::string ReadText(const std::string& path);
// The language id the library's table gives for the extension of `path`, or "".
std::string TableLanguageOf(const std::string& path);

}  // namespace cli

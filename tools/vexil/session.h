// One language server as the command-line host uses it: launched and initialized through
// the library's exports, with the documents it has opened, their versions and diagnostics.
#pragma once

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "vexil/host/language_server.h"

namespace cli {

struct SessionOptions {
  std::string name;  // the registry name
  std::string program;
  std::vector<std::string> arguments;  // at most seven
  std::string root;                    // absolute: the workspace root and the server's directory
  int timeout = 5000;
  LSP::TraceLevel trace = LSP::TraceLevel::Off;  // what of the library's trace is shown
  std::string language;  // the language id of every document, instead of the file's own
  std::vector<std::pair<std::string, std::string>> environment;  // the server's, over ours
  bool progress = false;  // announce work-done progress, and show it
  bool watch = false;     // tell the server about files changed under the root
  bool apply = false;     // write proposed edits, and those the server asks for, to the files
  std::string choice;     // the code action applied: its number from 1, or words of its title
};

class Session {
 public:
  explicit Session(const SessionOptions& options);
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  // Stops the server if that has not been tried.
  ~Session();

  // Launches and initializes the server; false with the reason in one line when that failed.
  bool Start(std::string& why);
  // Shutdown and exit; false when the server would not end.
  bool Stop();
  xLanguageServer& Server() { return *server_; }
  // The server's program as people name it: "clangd".
  std::string Program() const;
  // Whether edits are written to the files (--apply), or only shown.
  bool Applies() const { return options_.apply; }
  // Which code action --apply takes; "" for the preferred or only one.
  const std::string& Choice() const { return options_.choice; }
  // Whether the server's work-done progress is shown (--progress).
  bool ShowsProgress() const { return options_.progress; }

  // The URI of the absolute `path`, opened first (didOpen with its text) unless it is open.
  std::string Document(const std::string& path);
  bool IsOpen(const std::string& path) const;
  // Sends the file's current text as a new version.
  void Change(const std::string& path);
  void Save(const std::string& path);
  void Close(const std::string& path);
  // The document's diagnostics: pulled from a server that offers that, else the newest
  // publication since it was opened or changed, waited for up to the time-out.
  std::vector<LSP::Diagnostic> Diagnostics(const std::string& path);
  // The language id a document of `path` is opened with; "" when none is known.
  std::string LanguageOf(const std::string& path) const;

  // Marks the start of an operation, and afterwards tells whether it failed and why: the
  // server's error state, a `method` it does not offer, the first error line traced since
  // the mark, or the server's end.
  void Mark();
  bool Failed(const std::string& method, std::string& why);
  // Whether the server answered the last request as a method it does not offer.
  bool Unsupported();

 private:
  // What was sent last about a document: its version, and the diagnostics version and the
  // count of document sends then, to tell when its publication has come.
  struct OpenDocument {
    int version = 0;
    int diagnosticsMark = 0;
    int sendsMark = 0;
  };
  // Why the server did not start, in one line; `detail` is the failure Failed() found.
  std::string StartFailure(const std::string& detail);
  void Sent(OpenDocument& document);
  bool Published(const std::string& uri);

  SessionOptions options_;
  xLanguageServer* server_;
  std::map<std::string, OpenDocument> documents_;  // open documents by URI
  int sends_ = 0;                              // didOpen and didChange so far
  int errorMark_ = 0;
  bool stopTried_ = false;  // a server that would not end is not waited for twice
};

// `path` made absolute and normal, as documents are named.
std::string AbsolutePath(const std::string& path);
// `file` as given on the command line, resolved against the absolute directory `root`.
std::string ResolvePath(const std::string& root, const std::string& file);
std::string ReadText(const std::string& path);
// Throws Failure unless `path` is a readable file of UTF-8 text that a file URI can name.
void CheckDocument(const std::string& path, const std::string& shownAs);
// The language id of a file: the library's table, then the common extensions and names.
std::string KnownLanguageOf(const std::string& path);

}  // namespace cli

// The command-line host's session: a connection from Vexil_Start, the initialize data
// for the workspace root, document notifications that keep versions in step, and the
// reasons of failures told in one line.
#include "session.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <system_error>
#include <thread>

#include "columns.h"
#include "host_process.h"
#include "options.h"
#include "server_messages.h"
#include "trace_sink.h"
#include "vexil/client/uri.h"
#include "wait_notice.h"

#if defined(_WIN32)
#  include <process.h>
#  define getpid _getpid
#else
#  include <unistd.h>
#endif

namespace cli {
namespace {

constexpr int kExitAttempts = 10;
// The library waits at least this long for the answer to initialize.
constexpr int kInitializeWaitMs = 10000;
// SIGCHLD is taken on a thread of its own: how long its news may lag behind.
constexpr std::chrono::milliseconds kExitNewsWait{500};

xServerStart StartRecord(const SessionOptions& options) {
  xServerStart start;
  start.trace = &TraceToStderr;
  start.level = LSP::TraceLevel::Verbose;  // read in full; shown as far as asked
  start.timeout = options.timeout;
  start.executable = options.program;
  start.directory = options.root;
  std::string* slots[] = {&start.argument1, &start.argument2, &start.argument3, &start.argument4,
                          &start.argument5, &start.argument6, &start.argument7};
  for (std::size_t i = 0; i < options.arguments.size() && i < 7; ++i) *slots[i] = options.arguments[i];
  start.name = options.name;
  return start;
}

// The library's line for a reply that did not come in time.
const char kTimedOut[] = "Reply: Timed out";

std::string Seconds(int milliseconds) {
  char text[32];
  std::snprintf(text, sizeof text, "%g s", milliseconds / 1000.0);
  return text;
}

// How the server ended, once SIGCHLD has told; "" while it is not known.
std::string AwaitExit() {
  auto deadline = std::chrono::steady_clock::now() + kExitNewsWait;
  while (LastExit().empty() && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return LastExit();
}

}  // namespace

std::string AbsolutePath(const std::string& path) {
  std::error_code error;
  std::filesystem::path absolute = std::filesystem::absolute(path, error);
  std::string normal = (error ? std::filesystem::path(path) : absolute).lexically_normal().string();
  // "dir/." normalises to "dir/"; roots and URIs are named without the trailing slash.
  if (normal.size() > 1 && (normal.back() == '/' || normal.back() == '\\')) normal.pop_back();
  return normal;
}

std::string ResolvePath(const std::string& root, const std::string& file) {
  std::filesystem::path path(file);
  return AbsolutePath(path.is_absolute() ? file : (std::filesystem::path(root) / path).string());
}

std::string ReadText(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

void CheckDocument(const std::string& path, const std::string& shownAs) {
  std::error_code error;
  std::filesystem::file_status status = std::filesystem::status(path, error);
  if (error) throw Failure(shownAs + ": " + error.message());
  if (std::filesystem::is_directory(status)) throw Failure(shownAs + ": " + std::make_error_code(std::errc::is_a_directory).message());
  if (!std::ifstream(path)) throw Failure(shownAs + ": " + std::make_error_code(std::errc::permission_denied).message());
  std::string where = NotUtf8At(ReadText(path));
  if (!where.empty()) {
    throw Failure(shownAs + ": not UTF-8 text (" + where + "); servers read documents as UTF-8: convert it first, " +
                  "e.g. with iconv -f LATIN1 -t UTF-8");
  }
  if (FileToUri(path.c_str()).empty()) throw Failure(shownAs + ": the path cannot be written as a file URI");
}

Session::Session(const SessionOptions& options) : options_(options), server_(nullptr) {
  ListenForServer();
  server_ = Vexil_Start(StartRecord(options));
  for (const auto& [name, value] : options.environment) server_->SetEnvironment(name.c_str(), value.c_str());
  if (options.progress) server_->Enable("progress");
  if (options.watch) server_->Enable("watchedFiles");
  server_->SetMessageHandler(&ShowServerMessage, this);
}

Session::~Session() {
  if (Vexil_Have(options_.name.c_str()) != server_) return;
  // A server that would not end keeps running: it must not call back into this session.
  if (stopTried_ || !Stop()) server_->SetMessageHandler(nullptr, nullptr);
}

std::string Session::Program() const { return std::filesystem::path(options_.program).filename().string(); }

bool Session::Start(std::string& why) {
  xServerInitialise init;
  init.processId = static_cast<int>(getpid());
  init.rootPath = options_.root;
  init.workspaceFolders.emplace_back(FileToUri(options_.root.c_str()),
                                     std::filesystem::path(options_.root).filename().string());
  Mark();
  bool started = false;
  {
    WaitNotice notice(Program());
    started = server_->Start(init) && server_->IsRunning();
  }
  std::string detail;
  if (!NotAServer() && started && !Failed("initialize", detail)) return true;
  why = StartFailure(detail);
  return false;
}

std::string Session::StartFailure(const std::string& detail) {
  if (NotAServer()) return Program() + " does not speak the language server protocol";
  // A server whose output has ended may still be on its way out: SIGCHLD tells.
  const bool exited = !server_->HaveErrors() && !AwaitExit().empty();
  const std::string said = ServerSaid();
  if (exited) {
    return Program() + " exited with " + LastExit() + (said.empty() ? "" : ": " + said);
  }
  if (server_->HaveErrors()) return Program() + " did not start: " + server_->ErrorMessage();
  if (detail.find(" did not answer within ") != std::string::npos) {
    return Program() + " did not answer initialize within " + Seconds(std::max(options_.timeout, kInitializeWaitMs));
  }
  return Program() + " did not start: " + (!said.empty() ? said : !detail.empty() ? detail : TraceError(errorMark_));
}

bool Session::Stop() {
  stopTried_ = true;
  server_->Shutdown();
  // Each Exit gives the server about a second to end; an interpreter on a busy machine can
  // take longer, so the server counts as stuck only when several of them went by.
  bool ended = false;
  for (int attempt = 0; attempt < kExitAttempts && !ended; ++attempt) ended = server_->Exit();
  EndProgressLine();
  return ended;
}

std::string Session::Document(const std::string& path) {
  std::string uri = FileToUri(path.c_str());
  if (documents_.count(uri)) return uri;
  OpenDocument& document = documents_[uri];
  LSP::DidOpenTextDocumentParams params;
  params.textDocument.uri = uri;
  params.textDocument.languageId = LanguageOf(path);
  params.textDocument.version = document.version = 1;
  params.textDocument.text = ReadText(path);
  Sent(document);
  server_->TextDocument_DidOpen(&params);
  return uri;
}

bool Session::IsOpen(const std::string& path) const { return documents_.count(FileToUri(path.c_str())) > 0; }

void Session::Change(const std::string& path) {
  std::string uri = Document(path);
  OpenDocument& document = documents_[uri];
  LSP::DidChangeTextDocumentParams params;
  params.textDocument = LSP::VersionedTextDocumentIdentifier(uri, ++document.version);
  params.contentChanges.emplace_back();
  params.contentChanges.back().text = ReadText(path);
  Sent(document);
  server_->TextDocument_DidChange(&params);
}

void Session::Save(const std::string& path) {
  LSP::DidSaveTextDocumentParams params;
  params.textDocument.uri = Document(path);
  server_->TextDocument_DidSave(&params);
}

void Session::Close(const std::string& path) {
  LSP::DidCloseTextDocumentParams params;
  params.textDocument.uri = Document(path);
  server_->TextDocument_DidClose(&params);
  documents_.erase(params.textDocument.uri);
}

void Session::Sent(OpenDocument& document) {
  document.diagnosticsMark = server_->DiagnosticsVersion();
  document.sendsMark = ++sends_;
}

// Each didOpen and didChange brings one publication; so once as many have come since this
// document's last send as there were sends from it on, its own is among them.
bool Session::Published(const std::string& uri) {
  const OpenDocument& document = documents_[uri];
  int arrived = server_->DiagnosticsVersion() - document.diagnosticsMark;
  return !server_->TextDocument_Diagnostics(uri.c_str()).empty() || arrived > sends_ - document.sendsMark;
}

std::vector<LSP::Diagnostic> Session::Diagnostics(const std::string& path) {
  LSP::TextDocumentIdentifier document;
  document.uri = Document(path);
  int before = server_->DiagnosticsVersion();
  server_->TextDocument_PullDiagnostics(&document);
  if (server_->DiagnosticsVersion() != before) return server_->TextDocument_Diagnostics(document.uri.c_str());
  WaitNotice notice(Program() + "'s diagnostics");
  auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(options_.timeout);
  while (!Published(document.uri) && !Interrupted() && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return server_->TextDocument_Diagnostics(document.uri.c_str());
}

std::string Session::LanguageOf(const std::string& path) const {
  return options_.language.empty() ? KnownLanguageOf(path) : options_.language;
}

void Session::Mark() { errorMark_ = TraceErrors(); }

bool Session::Failed(const std::string& method, std::string& why) {
  if (server_->HaveErrors()) {
    why = server_->ErrorMessage();
    return true;
  }
  // An error answer that leaves no error state is the server's "method not found".
  if (*server_->ErrorMessage()) {
    why = Program() + " does not support " + method;
    return true;
  }
  if (!server_->IsRunning()) {
    std::string exit = AwaitExit();
    why = Program() + " has ended" + (exit.empty() ? "" : " with " + exit);
    return true;
  }
  if (TraceErrors() == errorMark_) return false;
  why = TraceError(errorMark_);
  if (why.rfind(kTimedOut, 0) == 0) {
    why = Program() + " did not answer within " + Seconds(options_.timeout) + "; a longer --timeout may help";
  }
  return true;
}

}  // namespace cli

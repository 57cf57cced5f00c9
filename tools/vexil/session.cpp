// The command-line host's session: a connection from Vexil_Start, the initialize data
// for the workspace root, and document notifications that keep versions in step.
#include "session.h"

#include <filesystem>
#include <fstream>
#include <sstream>

#include "trace_sink.h"
#include "vexil/client/uri.h"

#if defined(_WIN32)
#  include <process.h>
#  define getpid _getpid
#else
#  include <unistd.h>
#endif

namespace cli {
namespace {

constexpr int kExitAttempts = 10;

xServerStart StartRecord(const SessionOptions& options) {
  xServerStart start;
  start.trace = &TraceToStderr;
  start.level = options.trace;
  start.timeout = options.timeout;
  start.executable = options.program;
  start.directory = options.root;
  std::string* slots[] = {&start.argument1, &start.argument2, &start.argument3, &start.argument4,
                          &start.argument5, &start.argument6, &start.argument7};
  for (std::size_t i = 0; i < options.arguments.size() && i < 7; ++i) *slots[i] = options.arguments[i];
  start.name = options.name;
  return start;
}

}  // namespace

std::string TableLanguageOf(const std::string& path) {
  static const xLanguages languages;
  std::string extension = std::filesystem::path(path).extension().string();
  return extension.empty() ? "" : languages.LanguageId(extension.substr(1).c_str());
}

std::string AbsolutePath(const std::string& path) {
  std::error_code error;
  std::filesystem::path absolute = std::filesystem::absolute(path, error);
  std::string normal = (error ? std::filesystem::path(path) : absolute).lexically_normal().string();
  // "dir/." normalises to "dir/"; roots and URIs are named without the trailing slash.
  if (normal.size() > 1 && (normal.back() == '/' || normal.back() == '\\')) normal.pop_back();
  return normal;
}

std::string ReadText(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

Session::Session(const SessionOptions& options) : options_(options), server_(Vexil_Start(StartRecord(options))) {}

Session::~Session() {
  if (!stopTried_ && Vexil_Have(options_.name.c_str()) == server_) Stop();
}

bool Session::Start() {
  xServerInitialise init;
  init.processId = static_cast<int>(getpid());
  init.rootPath = options_.root;
  init.workspaceFolders.emplace_back(FileToUri(options_.root.c_str()),
                                     std::filesystem::path(options_.root).filename().string());
  Mark();
  return server_->Start(init) && server_->IsRunning();
}

bool Session::Stop() {
  stopTried_ = true;
  server_->Shutdown();
  // Each Exit gives the server about a second to end; an interpreter on a busy machine can
  // take longer, so the server counts as stuck only when several of them went by.
  for (int attempt = 0; attempt < kExitAttempts; ++attempt) {
    if (server_->Exit()) return true;
  }
  return false;
}

std::string Session::Document(const std::string& path) {
  std::string uri = FileToUri(AbsolutePath(path).c_str());
  if (versions_.count(uri)) return uri;
  LSP::DidOpenTextDocumentParams params;
  params.textDocument.uri = uri;
  params.textDocument.languageId = LanguageOf(path);
  params.textDocument.version = versions_[uri] = 1;
  params.textDocument.text = ReadText(path);
  server_->TextDocument_DidOpen(&params);
  return uri;
}

void Session::Change(const std::string& path) {
  std::string uri = Document(path);
  LSP::DidChangeTextDocumentParams params;
  params.textDocument = LSP::VersionedTextDocumentIdentifier(uri, ++versions_[uri]);
  params.contentChanges.emplace_back();
  params.contentChanges.back().text = ReadText(path);
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
  versions_.erase(params.textDocument.uri);
}

std::string Session::LanguageOf(const std::string& path) const {
  return options_.language.empty() ? TableLanguageOf(path) : options_.language;
}

void Session::Mark() { errorMark_ = TraceErrors(); }

bool Session::Failed(std::string& why) {
  if (server_->HaveErrors()) {
    why = server_->ErrorMessage();
    return true;
  }
  if (TraceErrors() == errorMark_) return false;
  why = TraceError(errorMark_);
  return true;
}

}  // namespace cli

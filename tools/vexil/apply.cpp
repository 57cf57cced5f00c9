// Writing edits through the library's workspace-edit helper, which checks every file before
// it replaces any. The server's own requests arrive on another thread, so what they leave
// for the action under way is kept under a lock.
#include "apply.h"

#include <exception>
#include <mutex>

#include "columns.h"
#include "session.h"
#include "vexil/client/uri.h"
#include "vexil/client/workspace_edits.h"
#include "vexil/json/json.h"
#include "vexil/protocol/code_actions.h"

namespace cli {
namespace {

std::mutex requestedMutex;
std::vector<FileEdits> requested;  // by the server since the last TakeRequestedEdits
bool requestedWritten = false;
std::string requestedFailure;  // why an edit the server asked for was not written

LSP::WorkspaceEdit EditOf(const std::vector<FileEdits>& files) {
  LSP::WorkspaceEdit edit;
  for (const FileEdits& file : files) {
    LSP::TextDocumentEdit document;
    document.textDocument.uri = FileToUri(file.path.c_str());
    document.edits = file.edits;
    edit.documentChanges.push_back(document);
  }
  return edit;
}

// Reads the params of "workspace/applyEdit"; false with the reason when they are malformed.
bool ReadParams(const char* json, LSP::ApplyWorkspaceEditParams& params, std::string& why) {
  LSP::xReader reader;
  try {
    if (reader.Parse(json) && reader.Root().IsObject()) {
      params.Read(reader.Root());
      return true;
    }
    why = "not a JSON object";
  } catch (const std::exception& error) {
    why = error.what();
  }
  params.edit.documentChanges.clear();
  return false;
}

}  // namespace

bool HasEdits(const std::vector<FileEdits>& files) {
  for (const FileEdits& file : files)
    if (!file.edits.empty()) return true;
  return false;
}

std::vector<FileEdits> FilesOf(const LSP::WorkspaceEdit& edit) {
  std::vector<FileEdits> files;
  for (const LSP::TextDocumentEdit& document : edit.documentChanges) {
    files.push_back({UriToFile(document.textDocument.uri.c_str()), document.edits});
  }
  return files;
}

bool WriteEdits(const std::vector<FileEdits>& files, std::string& why) {
  for (const FileEdits& file : files) TextOf(file.path);
  if (LSP::ApplyWorkspaceEdit(EditOf(files), why)) return true;
  why = "nothing written: " + why;
  return false;
}

void AfterWriting(Session& session, const std::vector<FileEdits>& files) {
  for (const FileEdits& file : files) {
    Reread(file.path);
    if (session.IsOpen(file.path)) session.Change(file.path);
  }
}

void AnswerApplyEdit(xLanguageServer& server, bool write, const char* idJson, const char* paramsJson) {
  LSP::ApplyWorkspaceEditParams params;
  LSP::ApplyWorkspaceEditResult result;
  const bool read = ReadParams(paramsJson, params, result.failureReason);
  const std::vector<FileEdits> files = FilesOf(params.edit);
  if (!read) result.failureReason = "the edit cannot be read: " + result.failureReason;
  else if (!write) result.failureReason = "vexil lsp writes edits only with --apply";
  else result.applied = WriteEdits(files, result.failureReason);
  {
    std::lock_guard<std::mutex> lock(requestedMutex);
    requested.insert(requested.end(), files.begin(), files.end());
    requestedWritten = requestedWritten || (result.applied && HasEdits(files));
    if (write && !result.applied && requestedFailure.empty()) requestedFailure = result.failureReason;
  }
  server.Reply(idJson, LSP::ToJsonText(result).c_str());
}

std::vector<FileEdits> TakeRequestedEdits(bool& written, std::string& failure) {
  std::lock_guard<std::mutex> lock(requestedMutex);
  std::vector<FileEdits> taken;
  taken.swap(requested);
  written = requestedWritten;
  requestedWritten = false;
  failure.swap(requestedFailure);
  requestedFailure.clear();
  return taken;
}

}  // namespace cli

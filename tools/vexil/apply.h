// Edits written to the files: those of an answer with `vexil lsp --apply`, and those a
// server asks for with "workspace/applyEdit", which are shown always and written only then.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/structures.h"

class xLanguageServer;

namespace cli {

class Session;

// The edits proposed for one file.
struct FileEdits {
  std::string path;
  std::vector<LSP::TextEdit> edits;
};

// Whether any file has an edit.
bool HasEdits(const std::vector<FileEdits>& files);
// The document changes of a workspace edit, file by file.
std::vector<FileEdits> FilesOf(const LSP::WorkspaceEdit& edit);

// Writes the edits of every file, all or nothing; false with the reason otherwise. Each
// file's text before them stays what TextOf gives, so the answer is shown against it.
bool WriteEdits(const std::vector<FileEdits>& files, std::string& why);
// Once the answer is shown: written files are read afresh, and those the server has open
// are sent their new text, as an editor would after saving them.
void AfterWriting(Session& session, const std::vector<FileEdits>& files);

// Answers the server's "workspace/applyEdit" request `idJson` (on the connection's
// dispatch thread): its edits are written when `write`, else declined; either way they are
// kept for TakeRequestedEdits.
void AnswerApplyEdit(xLanguageServer& server, bool write, const char* idJson, const char* paramsJson);
// The edits servers asked for since the last call, in order, whether they were written,
// and why one was not when it should have been ("" when none failed).
std::vector<FileEdits> TakeRequestedEdits(bool& written, std::string& failure);

}  // namespace cli

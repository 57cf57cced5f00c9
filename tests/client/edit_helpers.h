// Helpers of the text helper tests: edits, and document edits of a file.
#pragma once

#include <string>
#include <vector>

#include "vexil/client/uri.h"
#include "vexil/client/workspace_edits.h"

namespace vexil_test {

inline LSP::TextEdit Edit(int line, int from, int endLine, int to, const std::string& text) {
  LSP::TextEdit edit;
  edit.range = LSP::Range(LSP::Position(line, from), LSP::Position(endLine, to));
  edit.newText = text;
  return edit;
}

// The edits of the file `path`, or of `path` itself when it is already a URI.
inline LSP::TextDocumentEdit DocumentEdit(const std::string& path, std::vector<LSP::TextEdit> edits) {
  LSP::TextDocumentEdit document;
  document.textDocument.uri = path.find("://") != std::string::npos ? path : FileToUri(path.c_str());
  document.edits = std::move(edits);
  return document;
}

}  // namespace vexil_test

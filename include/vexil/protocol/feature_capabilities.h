// The client capabilities that the requests beyond the classic ones need, written apart
// from the default tree: a host that opts in has them merged over it (see
// ClientCapabilities::additions), and a host that does not sends the tree unchanged.
#pragma once

#include <string>
#include <vector>

#include "vexil/protocol/message.h"

namespace LSP {

// Written as a partial tree:
//   workspace: applyEdit, workspaceEdit.documentChanges (edits arrive in either form);
//   textDocument: synchronization.willSave, code action literals with their kinds and
//   isPreferred, rename.prepareSupport, and whole-document semantic tokens in the
//   relative format with the types and modifiers below.
class VEXIL_API FeatureClientCapabilities : public Params {
 public:
  FeatureClientCapabilities() { name = "capabilities"; }
  void Write(xWriter& writer) override;

  std::vector<std::string> codeActionKinds{"", "quickfix", "refactor", "refactor.extract", "refactor.inline",
                                           "refactor.rewrite", "source", "source.organizeImports"};
  std::vector<std::string> tokenTypes{"namespace", "type", "class", "enum", "interface", "struct", "typeParameter",
                                      "parameter", "variable", "property", "enumMember", "event", "function",
                                      "method", "macro", "keyword", "modifier", "comment", "string", "number",
                                      "regexp", "operator", "decorator"};
  std::vector<std::string> tokenModifiers{"declaration", "definition", "readonly", "static", "deprecated",
                                          "abstract", "async", "modification", "documentation", "defaultLibrary"};
};

}  // namespace LSP

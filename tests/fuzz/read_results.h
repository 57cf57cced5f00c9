// Reads one parsed reply into every result class, as the transport does with a server's
// answer. Type errors are thrown and caught by the transport; anything else (a crash, a
// sanitizer report, another kind of exception) is a fault.
#pragma once

#include <exception>
#include <initializer_list>
#include <memory>

#include "vexil/protocol/call_hierarchy.h"
#include "vexil/protocol/code_actions.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/initialize.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/semantic_tokens.h"
#include "vexil/protocol/structures.h"

namespace fuzz {

inline void ReadInto(LSP::xReader& reader, LSP::Result& result) {
  LSP::ResponseMessage response(&result);
  try {
    response.Read(reader);
  } catch (const std::exception&) {
  }
}

// A fresh result of each type, as each reply gets its own.
template <typename... Results>
void ReadIntoEach(LSP::xReader& reader) {
  (ReadInto(reader, *std::make_unique<Results>()), ...);
}

inline void ReadIntoEveryResult(LSP::xReader& reader) {
  LSP::SymbolInformationList symbols("file:///a.c");
  LSP::InitializeResult initialize;
  LSP::SemanticTokens tokens;
  for (LSP::Result* result : std::initializer_list<LSP::Result*>{&symbols, &initialize, &tokens}) ReadInto(reader, *result);
  tokens.Decode(initialize.capabilities.semanticTokensProvider.legend);
  ReadIntoEach<LSP::Hover, LSP::SignatureHelp, LSP::CompletionList, LSP::LocationsList, LSP::DocumentFormattingList,
               LSP::WorkspaceEdit, LSP::CodeActionList, LSP::JsonResult, LSP::DocumentHighlightList,
               LSP::FoldingRangeList, LSP::SelectionRangeList, LSP::InlayHintList, LSP::PrepareRenameResult,
               LSP::ResolvedCompletionItem, LSP::CallHierarchyItemList, LSP::CallHierarchyIncomingCallList,
               LSP::CallHierarchyOutgoingCallList>(reader);
}

}  // namespace fuzz

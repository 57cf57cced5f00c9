// Reads one parsed reply into every result class, as the transport does with a server's
// answer. Type errors are thrown and caught by the transport; anything else (a crash, a
// sanitizer report, another kind of exception) is a fault.
#pragma once

#include <exception>
#include <initializer_list>

#include "vexil/protocol/call_hierarchy.h"
#include "vexil/protocol/code_actions.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/initialize.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/semantic_tokens.h"
#include "vexil/protocol/structures.h"

namespace fuzz {

inline void ReadIntoEveryResult(LSP::xReader& reader) {
  LSP::Hover hover;
  LSP::SignatureHelp signatureHelp;
  LSP::CompletionList completion;
  LSP::LocationsList locations;
  LSP::SymbolInformationList symbols("file:///a.c");
  LSP::DocumentFormattingList formatting;
  LSP::WorkspaceEdit edit;
  LSP::InitializeResult initialize;
  LSP::CodeActionList actions;
  LSP::JsonResult any;
  LSP::DocumentHighlightList highlights;
  LSP::FoldingRangeList folding;
  LSP::SelectionRangeList selections;
  LSP::InlayHintList hints;
  LSP::PrepareRenameResult prepareRename;
  LSP::ResolvedCompletionItem resolved;
  LSP::SemanticTokens tokens;
  LSP::CallHierarchyItemList callItems;
  LSP::CallHierarchyIncomingCallList incoming;
  LSP::CallHierarchyOutgoingCallList outgoing;
  for (LSP::Result* result : std::initializer_list<LSP::Result*>{
           &hover, &signatureHelp, &completion, &locations, &symbols, &formatting, &edit, &initialize, &actions, &any,
           &highlights, &folding, &selections, &hints, &prepareRename, &resolved, &tokens, &callItems, &incoming,
           &outgoing}) {
    LSP::ResponseMessage response(result);
    try {
      response.Read(reader);
    } catch (const std::exception&) {
    }
  }
  tokens.Decode(initialize.capabilities.semanticTokensProvider.legend);
}

}  // namespace fuzz

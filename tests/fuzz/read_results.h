// Reads one parsed reply into every result class, as the transport does with a server's
// answer. Type errors are thrown and caught by the transport; anything else (a crash, a
// sanitizer report, another kind of exception) is a fault.
#pragma once

#include <exception>
#include <initializer_list>
#include <memory>
#include <sstream>
#include <string>

#include "protocol/completion_events.h"
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

// Everything a completion reply puts into the response and its list.
inline std::string Digest(const LSP::ResponseMessage& response, const LSP::CompletionList& list) {
  std::ostringstream out;
  out << response.id << '|' << response.jsonrpc << '|' << list.isIncomplete;
  for (const LSP::CompletionItem& i : list.items) {
    const LSP::Range& r = i.textEdit.range;
    out << "\n"
        << i.label << '|' << i.labelDetails.detail << '|' << i.labelDetails.description << '|' << i.kind << '|'
        << i.detail << '|' << i.documentation.kind << '|' << i.documentation.value << '|'
        << i.documentation.items.size() << '|' << i.deprecated << '|' << i.sortText << '|' << i.filterText << '|'
        << i.insertText << '|' << i.insertTextFormat << '|' << r.start.line << ':' << r.start.character << '-'
        << r.end.line << ':' << r.end.character << '|' << i.textEdit.newText << '|' << i.rawJson;
  }
  return out.str();
}

// A list that already holds an item, as one a host reads several replies into.
inline LSP::CompletionList EarlierList() {
  LSP::CompletionList list;
  list.keepItemJson = false;
  list.isIncomplete = true;
  list.items.emplace_back();
  list.items.back().label = "earlier";
  return list;
}

// What the connection makes of `text` as the reply to `id` through the document.
inline std::string DocumentRead(const std::string& text, int id) {
  LSP::CompletionList list = EarlierList();
  LSP::xReader reader;
  if (!reader.Parse(text)) return "parse error";
  try {
    LSP::xObject root = reader.Root();
    if (!root.IsObject() || root.HasObject("method") || root.HasObject("error") || root.Int("id") != id)
      return "not the reply";
    LSP::ResponseMessage response(&list);
    response.Read(reader);
    return Digest(response, list);
  } catch (const std::exception& e) {
    return std::string("threw: ") + e.what();
  }
}

// Reads `text` as the reply to `id` from the parser's events: "taken" when that read took
// it and holds what the document read holds, "declined" when it left the list as it was.
inline std::string ReadBothWays(const std::string& text, int id) {
  LSP::CompletionList list = EarlierList();
  LSP::ResponseMessage response(&list);
  const std::string before = Digest(response, list);
  if (!LSP::ReadCompletionReply(text, id, response))
    return Digest(response, list) == before ? "declined" : "declined, but changed the list";
  const std::string read = Digest(response, list);
  const std::string expected = DocumentRead(text, id);
  return read == expected ? "taken" : "taken as\n" + read + "\nwhere the document read gives\n" + expected;
}

}  // namespace fuzz

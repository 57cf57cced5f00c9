// Helpers of the protocol tests: test data files, reading a reply text into a result the
// way the transport does (parse, then the response bound to the caller's result), and
// digests that let a table row state in one text what a result holds.
#pragma once

#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <vector>

#include "vexil/protocol/code_actions.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"
#include "vexil_test/support.h"

namespace vexil_test {

inline std::string ReadDataFile(const std::string& relative) {
  const std::string text = ReadFile(std::string(VEXIL_TEST_DATA) + "/" + relative);
  EXPECT_FALSE(text.empty()) << relative;
  return text;
}

// Reads a whole reply into `result`; returns the response for its id and error.
inline LSP::ResponseMessage ReadReply(const std::string& text, LSP::Result& result) {
  LSP::xReader reader;
  EXPECT_TRUE(reader.Parse(text)) << reader.Error();
  LSP::ResponseMessage response(&result);
  response.Read(reader);
  return response;
}

// Reads `json` as the value of a reply's "result".
inline void ReadResult(const std::string& json, LSP::Result& result) {
  ReadReply(R"({"jsonrpc":"2.0","id":1,"result":)" + json + "}", result);
}

// The text of an exception thrown by `action`, or "" when none was thrown.
template <typename Action>
std::string ThrownText(Action action) {
  try {
    action();
  } catch (const std::exception& e) {
    return e.what();
  }
  return "";
}

// A range as "line:character-line:character", for digests.
inline std::ostream& operator<<(std::ostream& out, const LSP::Range& range) {
  return out << range.start.line << ':' << range.start.character << '-' << range.end.line << ':'
             << range.end.character;
}

// Values joined by '|': what a row of a reading table expects a result to hold.
template <typename... Values>
std::string Fields(const Values&... values) {
  std::ostringstream text;
  const char* separator = "";
  ((text << separator << values, separator = "|"), ...);
  return text.str();
}

// Each item's digest, joined by `separator`.
template <typename Item, typename Digest>
std::string Items(const std::vector<Item>& items, Digest digest, const char* separator = ";") {
  std::string text;
  for (std::size_t i = 0; i < items.size(); ++i) text += (i ? separator : "") + digest(items[i]);
  return text;
}

// Reads `json` as a reply's result into `result` and returns `digest(result)`, or the text
// the reading threw, after "threw: ".
template <typename Result, typename Digest>
std::string ReadAs(const std::string& json, Digest digest, Result result = Result()) {
  const std::string thrown = ThrownText([&] { ReadResult(json, result); });
  return thrown.empty() ? digest(result) : "threw: " + thrown;
}

// A table row: what a reading gave, and what it should have given.
struct ReadRow {
  const char* name;
  std::string read;
  std::string expected;
};

// A recorded uri from the example projects on, whichever machine recorded it.
inline std::string Local(const std::string& uri) {
  const auto examples = uri.find("/examples/");
  return examples == std::string::npos ? uri : uri.substr(examples);
}

inline const std::string kNoRange = "-1:-1--1:-1";

// What the results hold, for the reading tables.
inline std::string Completions(const LSP::CompletionList& list) {
  return Fields(list.items.size(), list.isIncomplete, list.items.empty() ? "" : list.items.back().label);
}
inline std::string Item(const LSP::CompletionItem& i) {
  return Fields(i.label, i.labelDetails.detail, i.labelDetails.description, i.kind, i.detail, i.documentation.value,
                i.deprecated, i.sortText, i.filterText, i.insertText, i.insertTextFormat, i.textEdit.range,
                i.textEdit.newText);
}
inline std::string Locations(const LSP::LocationsList& list) {
  return Fields(list.items.size(), Items(list.items, [](const LSP::Location& l) { return Fields(Local(l.uri), l.range); }));
}
inline std::string Hovered(const LSP::Hover& hover) {
  return Fields(hover.contents.kind, hover.contents.value,
                Items(hover.contents.items, [](const LSP::MarkedString& m) { return m.language + ":" + m.value; }),
                hover.range);
}
inline std::string Signatures(const LSP::SignatureHelp& help) {
  return Fields(help.activeSignature, help.activeParameter,
                Items(help.signatures, [](const LSP::SignatureInformation& s) {
                  return Fields(s.label, s.documentation.value,
                                Items(s.parameters, [](const LSP::ParameterInformation& p) { return p.label; }));
                }));
}
inline std::string Symbols(const std::vector<LSP::SymbolInformation>& symbols) {
  return Items(symbols, [](const LSP::SymbolInformation& s) {
    return Fields(s.name, s.kind, Local(s.location.uri), s.location.range) +
           (s.children.empty() ? "" : "{" + Symbols(s.children) + "}");
  });
}
inline std::string Edits(const std::vector<LSP::TextEdit>& edits) {
  return Items(edits, [](const LSP::TextEdit& e) { return Fields(e.range, e.newText); });
}
inline std::string Changes(const LSP::WorkspaceEdit& edit) {
  return Items(edit.documentChanges, [](const LSP::TextDocumentEdit& d) {
    return Fields(Local(d.textDocument.uri), d.textDocument.version, Edits(d.edits));
  });
}
inline std::string Actions(const LSP::CodeActionList& list) {
  return Items(list.items, [](const LSP::CodeAction& a) {
    return Fields(a.title, a.kind, a.HasEdit(), a.HasCommand(), a.command.title, a.command.command, a.command.arguments,
                  Items(a.diagnostics, [](const LSP::Diagnostic& d) { return d.codeText; }),
                  Changes(a.edit));
  });
}
inline std::string Selections(const LSP::SelectionRangeList& list) {
  return Items(list.items, [](const LSP::SelectionRange& s) {
    return Fields(s.range, Items(s.parents, [](const LSP::Range& r) { return Fields(r); }, ","));
  });
}
inline std::string Hints(const LSP::InlayHintList& list) {
  return Items(list.items, [](const LSP::InlayHint& h) {
    return Fields(h.label, Items(h.labelParts, [](const auto& p) { return p.value + "@" + p.location.uri; }, ","),
                  h.kind, h.paddingLeft, h.paddingRight, h.tooltip.value, Edits(h.textEdits));
  });
}
inline std::string Renaming(const LSP::PrepareRenameResult& result) {
  return Fields(result.CanRename(), result.range, result.placeholder);
}

inline void CheckRows(const std::vector<ReadRow>& rows) {
  for (const ReadRow& row : rows) EXPECT_EQ(row.read, row.expected) << row.name;
}

}  // namespace vexil_test

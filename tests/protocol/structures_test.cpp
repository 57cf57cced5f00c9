// Core structures on the wire: the flattened ranges of edits and diagnostics, the
// protocol-shaped change events, document text always sent, and every reading rule.
#include <gtest/gtest.h>

#include <string>

#include "vexil/protocol/structures.h"

namespace {

template <typename T>
T ReadJson(const std::string& json) {
  LSP::xReader reader;
  EXPECT_TRUE(reader.Parse(json)) << reader.Error();
  T value;
  value.Read(reader.Root());
  return value;
}

template <typename T>
std::string ErrorReading(const std::string& json) {
  try {
    ReadJson<T>(json);
  } catch (const std::exception& e) {
    return e.what();
  }
  return "no exception";
}

}  // namespace

TEST(Structures, EditsAndDiagnosticsWriteTheirRangeFlattened) {
  auto edit = ReadJson<LSP::TextEdit>(
      R"({"range":{"start":{"line":2,"character":0},"end":{"line":2,"character":3}},"newText":""})");
  EXPECT_EQ(edit.range.end.character, 3);
  EXPECT_EQ(LSP::ToJsonText(edit), R"({"start":{"line":2,"character":0},"end":{"line":2,"character":3}})");
  edit.newText = "abc";
  EXPECT_EQ(LSP::ToJsonText(edit),
            R"({"start":{"line":2,"character":0},"end":{"line":2,"character":3},"newText":"abc"})");

  auto diagnostic = ReadJson<LSP::Diagnostic>(
      R"({"range":{"start":{"line":1,"character":2},"end":{"line":1,"character":5}},"code":7,"source":"x","message":"bad"})");
  EXPECT_EQ(LSP::ToJsonText(diagnostic),
            R"({"start":{"line":1,"character":2},"end":{"line":1,"character":5},"code":7,"source":"x","message":"bad"})");
  EXPECT_STREQ(diagnostic.Name(), "params");
}

TEST(Structures, DiagnosticsReadTextCodesAndSeverityButWriteAsBefore) {
  auto clangd = ReadJson<LSP::Diagnostic>(
      R"({"range":{"start":{"line":3,"character":8},"end":{"line":3,"character":9}},"severity":1,)"
      R"("code":"undeclared_var_use","source":"clang","message":"Use of undeclared identifier 'y'"})");
  EXPECT_EQ(clangd.code, -1);
  EXPECT_EQ(clangd.codeText, "undeclared_var_use");
  EXPECT_EQ(clangd.severity, 1);
  EXPECT_EQ(LSP::ToJsonText(clangd),
            R"({"start":{"line":3,"character":8},"end":{"line":3,"character":9},"code":-1,"source":"clang",)"
            R"("message":"Use of undeclared identifier 'y'"})");

  auto bare = ReadJson<LSP::Diagnostic>(R"({"message":"m"})");
  EXPECT_EQ(bare.severity, -1);
  EXPECT_EQ(bare.code, -1);
  EXPECT_EQ(bare.codeText, "");
  EXPECT_THROW(ReadJson<LSP::Diagnostic>(R"({"code":{"value":1}})"), std::exception);
}

TEST(Structures, ChangeEventsCarryTheProtocolRangeAndAlwaysTheText) {
  LSP::TextDocumentContentChangeEvent whole;
  EXPECT_STREQ(whole.Name(), "contentChanges");
  EXPECT_EQ(LSP::ToJsonText(whole), R"({"text":""})");
  whole.text = "int x;\n";
  EXPECT_EQ(LSP::ToJsonText(whole), R"({"text":"int x;\n"})");

  LSP::TextDocumentContentChangeEvent ranged;
  ranged.range.reset(new LSP::Range({1, 0}, {1, 4}));
  ranged.text = "abc";
  EXPECT_EQ(LSP::ToJsonText(ranged),
            R"({"range":{"start":{"line":1,"character":0},"end":{"line":1,"character":4}},"text":"abc"})");
  ranged.rangeLength.reset(new int(4));
  ranged.text.clear();
  const std::string deletion =
      R"({"range":{"start":{"line":1,"character":0},"end":{"line":1,"character":4}},"rangeLength":4,"text":""})";
  EXPECT_EQ(LSP::ToJsonText(ranged), deletion);

  // Copies are deep: the original's range and length are not shared.
  LSP::TextDocumentContentChangeEvent copy = ranged;
  ranged.range.reset();
  ranged.rangeLength.reset();
  EXPECT_EQ(LSP::ToJsonText(copy), deletion);
  copy = copy;
  EXPECT_EQ(LSP::ToJsonText(copy), deletion);
}

TEST(Structures, DocumentsAndIdentifiers) {
  LSP::TextDocumentItem item;
  item.uri = "file:///empty.cpp";
  item.languageId = "cpp";
  item.version = 1;
  EXPECT_EQ(LSP::ToJsonText(item), R"({"uri":"file:///empty.cpp","languageId":"cpp","version":1,"text":""})");
  item = ReadJson<LSP::TextDocumentItem>(R"({"uri":"u","languageId":"c","text":"t"})");
  EXPECT_EQ(item.version, -1);
  EXPECT_EQ(item.text, "t");

  LSP::VersionedTextDocumentIdentifier versioned("file:///a.c", 3);
  EXPECT_EQ(LSP::ToJsonText(versioned), R"({"uri":"file:///a.c","version":3})");
  EXPECT_EQ(ReadJson<LSP::VersionedTextDocumentIdentifier>(R"({"uri":"u","version":null})").version, -1);
  EXPECT_STREQ(versioned.Name(), "textDocument");
  LSP::TextDocumentIdentifier unnamed;
  EXPECT_EQ(LSP::ToJsonText(unnamed), "{}");

  auto position = ReadJson<LSP::Position>("{}");
  EXPECT_EQ(position.line, -1);
  EXPECT_EQ(position.character, -1);
  auto location = ReadJson<LSP::Location>(
      R"({"uri":"file:///b.c","range":{"start":{"line":4,"character":1},"end":{"line":4,"character":9}}})");
  EXPECT_EQ(LSP::ToJsonText(location),
            R"({"uri":"file:///b.c","range":{"start":{"line":4,"character":1},"end":{"line":4,"character":9}}})");
  LSP::WorkspaceFolder folder("file:///w", "");
  EXPECT_EQ(LSP::ToJsonText(folder), R"({"uri":"file:///w"})");
}

TEST(Structures, WorkspaceEditsAndTheirArrayErrors) {
  auto edit = ReadJson<LSP::WorkspaceEdit>(
      R"({"documentChanges":[{"textDocument":{"uri":"file:///a.c","version":2},"edits":[)"
      R"({"range":{"start":{"line":0,"character":0},"end":{"line":0,"character":1}},"newText":"x"}]}]})");
  EXPECT_EQ(LSP::ToJsonText(edit),
            R"({"documentChanges":[{"textDocument":{"uri":"file:///a.c","version":2},"edits":[)"
            R"({"start":{"line":0,"character":0},"end":{"line":0,"character":1},"newText":"x"}]}]})");

  EXPECT_TRUE(ReadJson<LSP::WorkspaceEdit>("{}").documentChanges.empty());
  EXPECT_EQ(ErrorReading<LSP::WorkspaceEdit>(R"({"documentChanges":{}})"),
            "Expecting a array JSON object but found 3 JSON object .");
  EXPECT_EQ(ErrorReading<LSP::WorkspaceEdit>(R"({"documentChanges":[{"edits":"no"}]})"),
            "Error:Expecting a array JSON object but found 5 JSON object .\n\n"
            "Expecting a array JSON object but found 4 JSON object.");
}

TEST(Structures, SymbolsNestChildrenLeniently) {
  auto symbol = ReadJson<LSP::SymbolInformation>(
      R"({"name":"S","kind":5,"containerName":"ns","children":[1,{"name":"a","kind":12,)"
      R"("children":[{"name":"b","kind":13}]},"x"]})");
  EXPECT_EQ(symbol.containerName, "ns");
  ASSERT_EQ(symbol.children.size(), 1u);
  EXPECT_EQ(symbol.children[0].name, "a");
  ASSERT_EQ(symbol.children[0].children.size(), 1u);
  EXPECT_EQ(symbol.children[0].children[0].kind, 13);
  EXPECT_EQ(symbol.location.range.start.line, -1);
  EXPECT_EQ(LSP::ToJsonText(symbol),
            R"({"name":"S","kind":5,"deprecated":false,"location":{"range":{"start":{"line":-1,"character":-1},)"
            R"("end":{"line":-1,"character":-1}}}})");
  EXPECT_TRUE(ReadJson<LSP::SymbolInformation>(R"({"children":{}})").children.empty());
}

// The array of marked strings is read in the hover test.
TEST(Structures, MarkupContentAsAnObjectOrAPlainString) {
  auto markup = ReadJson<LSP::MarkupContent>(R"({"kind":"markdown","value":"**x**"})");
  EXPECT_EQ(LSP::ToJsonText(markup), R"({"kind":"markdown","value":"**x**"})");

  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"s":"plain","n":null})"));
  LSP::MarkupContent content;
  content.kind = "stale";
  content.Read(reader.Root().Object("s"));
  EXPECT_EQ(content.kind, "");
  EXPECT_EQ(content.value, "plain");
  content.Read(reader.Root().Object("n"));
  EXPECT_EQ(content.value, "");
}

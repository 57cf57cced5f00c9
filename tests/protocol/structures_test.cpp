// Core structures on the wire: the flattened ranges of edits and diagnostics, the
// protocol-shaped change events, document text always sent, workspace edits from either
// member servers answer with, and every reading rule.
#include <gtest/gtest.h>

#include <string>

#include "reply_helpers.h"
#include "vexil/protocol/structures.h"

namespace {

using namespace vexil_test;

template <typename T>
T ReadJson(const std::string& json) {
  LSP::xReader reader;
  EXPECT_TRUE(reader.Parse(json)) << reader.Error();
  T value;
  value.Read(reader.Root());
  return value;
}

// `json` read as a T and written back, or what the reading threw.
template <typename T>
std::string RoundTrip(const std::string& json) {
  std::string written;
  const std::string thrown = ThrownText([&] {
    T value = ReadJson<T>(json);
    written = LSP::ToJsonText(value);
  });
  return thrown.empty() ? written : "threw: " + thrown;
}

const std::string kRange = R"({"start":{"line":1,"character":0},"end":{"line":1,"character":4}})";
const std::string kFlat = R"("start":{"line":1,"character":0},"end":{"line":1,"character":4})";

TEST(Structures, WrittenBackAsServersParseThem) {
  LSP::TextDocumentContentChangeEvent whole, ranged;
  ranged.range.reset(new LSP::Range({1, 0}, {1, 4}));
  ranged.text = "abc";
  LSP::TextDocumentItem item;
  item.uri = "file:///empty.cpp";
  item.languageId = "cpp";
  item.version = 1;
  LSP::VersionedTextDocumentIdentifier versioned("file:///a.c", 3);
  LSP::TextDocumentIdentifier unnamed;
  LSP::WorkspaceFolder folder("file:///w", "");
  const std::string symbol = R"({"name":"S","kind":5,"deprecated":false,"location":{"range":{"start":)"
                             R"({"line":-1,"character":-1},"end":{"line":-1,"character":-1}}}})";
  CheckRows({
      // Edits and diagnostics write their range flattened, and an edit its text only when there is
      // one (the workspace edit's row has an edit with text).
      {"edit without text", RoundTrip<LSP::TextEdit>(R"({"range":)" + kRange + R"(,"newText":""})"), "{" + kFlat + "}"},
      {"diagnostic", RoundTrip<LSP::Diagnostic>(R"({"range":)" + kRange + R"(,"code":7,"source":"x","message":"bad"})"),
       "{" + kFlat + R"(,"code":7,"source":"x","message":"bad"})"},
      // A text code and a severity are read, yet the diagnostic writes as before.
      {"diagnostic with a text code",
       RoundTrip<LSP::Diagnostic>(R"({"range":)" + kRange + R"(,"severity":1,"code":"undeclared_var_use","message":"m"})"),
       "{" + kFlat + R"(,"code":-1,"message":"m"})"},
      {"diagnostic with an object code", RoundTrip<LSP::Diagnostic>(R"({"code":{"value":1}})"),
       "threw: Expecting a 'int' JSON object but found 'object' JSON object."},
      {"whole change", LSP::ToJsonText(whole), R"({"text":""})"},
      {"ranged change", LSP::ToJsonText(ranged), R"({"range":)" + kRange + R"(,"text":"abc"})"},
      {"document always with its text", LSP::ToJsonText(item),
       R"({"uri":"file:///empty.cpp","languageId":"cpp","version":1,"text":""})"},
      {"versioned identifier", LSP::ToJsonText(versioned), R"({"uri":"file:///a.c","version":3})"},
      {"identifier without uri", LSP::ToJsonText(unnamed), "{}"},
      {"folder without name", LSP::ToJsonText(folder), R"({"uri":"file:///w"})"},
      {"location", RoundTrip<LSP::Location>(R"({"uri":"file:///b.c","range":)" + kRange + "}"),
       R"({"uri":"file:///b.c","range":)" + kRange + "}"},
      {"markup", RoundTrip<LSP::MarkupContent>(R"({"kind":"markdown","value":"**x**"})"),
       R"({"kind":"markdown","value":"**x**"})"},
      {"symbol", RoundTrip<LSP::SymbolInformation>(R"({"name":"S","kind":5,"children":[{"name":"a"}]})"), symbol},
      {"workspace edit",
       RoundTrip<LSP::WorkspaceEdit>(R"({"documentChanges":[{"textDocument":{"uri":"file:///a.c","version":2},)"
                                     R"("edits":[{"range":)" + kRange + R"(,"newText":"x"}]}]})"),
       R"({"documentChanges":[{"textDocument":{"uri":"file:///a.c","version":2},"edits":[{)" + kFlat +
           R"(,"newText":"x"}]}]})"},
  });
  // Copies are deep: the original's range and length are not shared.
  ranged.rangeLength.reset(new int(4));
  ranged.text = "int x;\n";
  const std::string deletion = R"({"range":)" + kRange + R"(,"rangeLength":4,"text":"int x;\n"})";
  EXPECT_EQ(LSP::ToJsonText(ranged), deletion);
  LSP::TextDocumentContentChangeEvent copy = ranged;
  ranged.range.reset();
  ranged.rangeLength.reset();
  EXPECT_EQ(LSP::ToJsonText(copy), deletion);
  copy = copy;
  EXPECT_EQ(LSP::ToJsonText(copy), deletion);
}

TEST(Structures, AbsentMembersReadAsTheirDefaultsAndWorkspaceEditsFromEitherMember) {
  const auto diagnostic = ReadJson<LSP::Diagnostic>(R"({"severity":1,"code":"E1","message":"m"})");
  const auto bare = ReadJson<LSP::Diagnostic>(R"({"message":"m"})");
  const auto item = ReadJson<LSP::TextDocumentItem>(R"({"uri":"u","languageId":"c","text":"t"})");
  const auto symbol = ReadJson<LSP::SymbolInformation>(
      R"({"name":"S","kind":5,"containerName":"ns","children":[1,{"name":"a","kind":12,)"
      R"("children":[{"name":"b","kind":13}]},"x"]})");
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"s":"plain","n":null})"));
  LSP::MarkupContent markup;
  markup.kind = "stale";
  markup.Read(reader.Root().Object("s"));
  const std::string plain = Fields(markup.kind, markup.value);
  markup.Read(reader.Root().Object("n"));
  const std::string edit = R"({"range":)" + kRange + R"(,"newText":"new"})";
  const std::string map =
      R"({"changes":{"file:///z.c":[)" + edit + "," + edit + R"(],"file:///a.c":[)" + edit + R"(],"file:///m.c":[]}})";
  CheckRows({
      {"diagnostic", Fields(diagnostic.severity, diagnostic.code, diagnostic.codeText), "1|-1|E1"},
      {"bare diagnostic", Fields(bare.severity, bare.code, bare.codeText), "-1|-1|"},
      {"document", Fields(item.version, item.text), "-1|t"},
      {"null version", Fields(ReadJson<LSP::VersionedTextDocumentIdentifier>(R"({"uri":"u","version":null})").version),
       "-1"},
      {"position", Fields(ReadJson<LSP::Position>("{}").line, ReadJson<LSP::Position>("{}").character), "-1|-1"},
      // Children that are not objects are skipped.
      {"nested symbols", Fields(symbol.containerName, Symbols({symbol})),
       "ns|S|5||" + kNoRange + "{a|12||" + kNoRange + "{b|13||" + kNoRange + "}}"},
      {"symbol children not an array", Symbols(ReadJson<LSP::SymbolInformation>(R"({"children":{}})").children), ""},
      {"markup as a plain string", plain, "|plain"},
      {"markup null", Fields(markup.kind, markup.value), "|"},
      // Most servers answer a rename with the "changes" map: one unversioned edit per document,
      // in map order, written back as "documentChanges" as always.
      {"changes map", ReadAs<LSP::WorkspaceEdit>(map, Changes),
       "file:///z.c|-1|1:0-1:4|new;1:0-1:4|new;file:///a.c|-1|1:0-1:4|new;file:///m.c|-1|"},
      {"changes map written back",
       ReadAs<LSP::WorkspaceEdit>(map, [](LSP::WorkspaceEdit e) { return LSP::ToJsonText(e.documentChanges.at(1)); }),
       R"({"textDocument":{"uri":"file:///a.c","version":-1},"edits":[{)" + kFlat + R"(,"newText":"new"}]})"},
      {"document changes win",
       ReadAs<LSP::WorkspaceEdit>(
           R"({"changes":{"file:///a.c":[)" + edit +
               R"(]},"documentChanges":[{"textDocument":{"uri":"file:///b.c","version":4},"edits":[)" + edit + "]}]}",
           Changes),
       "file:///b.c|4|1:0-1:4|new"},
      {"changes null", ReadAs<LSP::WorkspaceEdit>(R"({"changes":null})", Changes), ""},
      {"neither", ReadAs<LSP::WorkspaceEdit>("{}", Changes), ""},
      {"document changes not an array", ReadAs<LSP::WorkspaceEdit>(R"({"documentChanges":{}})", Changes),
       "threw: Expecting a array JSON object but found 3 JSON object ."},
      {"document edits not an array", ReadAs<LSP::WorkspaceEdit>(R"({"documentChanges":[{"edits":"no"}]})", Changes),
       "threw: Error:Expecting a array JSON object but found 5 JSON object .\n\n"
       "Expecting a array JSON object but found 4 JSON object."},
      {"changes not an object", ReadAs<LSP::WorkspaceEdit>(R"({"changes":[]})", Changes),
       "threw: Expecting a object JSON object but found 4 JSON object ."},
      {"changes of a document not an array", ReadAs<LSP::WorkspaceEdit>(R"({"changes":{"file:///a.c":{}}})", Changes),
       "threw: Expecting a array JSON object but found 3 JSON object ."},
  });
}

}  // namespace

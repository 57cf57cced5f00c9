// Feature results in every shape a server may send: bare arrays and list objects, null,
// single locations, string / array hover contents, hierarchical symbols, code actions mixed
// with bare commands, selection chains, hint labels, rename answers, tokens. Shapes the
// recorded replies hold (a markup hover, a bare range to rename) are read there.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "../fuzz/read_results.h"
#include "reply_helpers.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/semantic_tokens.h"

namespace {

using namespace vexil_test;

const std::string kRange = R"({"start":{"line":2,"character":1},"end":{"line":2,"character":5}})";
const std::string kNotAnArray = "threw: Expecting a array JSON object but found 3 JSON object .";

LSP::CompletionList WithoutItemJson() {
  LSP::CompletionList list;
  list.keepItemJson = false;
  return list;
}

TEST(FeatureResults, EveryShapeAServerMaySendReadsIntoItsResult) {
  const std::string item = R"j({"label":"push_back","labelDetails":{"detail":"(T)","description":"void"},"kind":2,)j"
                           R"("detail":"void","documentation":"Appends.","deprecated":true,"sortText":"1",)"
                           R"("filterText":"pb","insertText":"push_back","insertTextFormat":2,"textEdit":{"range":)" +
                           kRange + R"(,"newText":"push_back"},"commitCharacters":["("]})";
  const std::string symbols = R"([{"name":"body","kind":5,"range":)" + kRange +
                              R"(,"selectionRange":{"start":{"line":2,"character":1},"end":{"line":2,"character":2}},)"
                              R"("children":[{"name":"color","kind":7,"range":{"start":{"line":3,"character":2},)"
                              R"("end":{"line":3,"character":9}},"selectionRange":{"start":{"line":3,"character":2},)"
                              R"("end":{"line":3,"character":7}}}]},)"
                              R"({"name":"flat","kind":12,"location":{"uri":"file:///other.css","range":)" +
                              kRange + "}}]";
  const std::string actions =
      R"([{"title":"Run","command":"run","arguments":[1,{"a":null}]},)"
      R"({"title":"Fix","kind":"quickfix","diagnostics":[{"range":)" + kRange +
      R"(,"message":"m","code":"E1"}],"edit":{"documentChanges":[{"textDocument":)"
      R"({"uri":"file:///a.c","version":3},"edits":[{"range":)" + kRange +
      R"(,"newText":"x"}]}]},"command":{"title":"Then","command":"after"}},{"title":"Bare"}])";
  const std::string hints =
      R"([{"position":{"line":3,"character":8},"label":"value:","kind":2,"paddingRight":true},)"
      R"({"position":{"line":4,"character":1},"label":[{"value":": "},{"value":"Rectangle","location":)"
      R"({"uri":"file:///s.h","range":{"start":{"line":9,"character":6},"end":{"line":9,"character":15}}}}],)"
      R"("tooltip":"type","textEdits":[{"range":{"start":{"line":4,"character":1},"end":{"line":4,"character":1}},)"
      R"("newText":": Rectangle"}]}])";
  vexil_test::CheckRows({
      {"completion array", ReadAs<LSP::CompletionList>(R"([{"label":"a"},{"label":"b"}])", Completions), "2|0|b"},
      {"completion list",
       ReadAs<LSP::CompletionList>(R"({"isIncomplete":true,"items":[{"label":"a"},{"label":"b"}]})", Completions),
       "2|1|b"},
      {"completion null", ReadAs<LSP::CompletionList>("null", Completions), "0|0|"},
      {"completion text", ReadAs<LSP::CompletionList>(R"("text")", Completions), "0|0|"},
      {"completion number", ReadAs<LSP::CompletionList>("3", Completions), "0|0|"},
      {"completion items not an array", ReadAs<LSP::CompletionList>(R"({"items":{}})", Completions), kNotAnArray},
      // Each item keeps its text, for a resolve, unless the list is told it need not.
      {"completion items",
       ReadAs<LSP::CompletionList>("[" + item + R"(,{"label":"x"}])",
                                   [&](const LSP::CompletionList& l) {
                                     return Items(l.items, Item) + "|" + std::to_string(l.items[0].rawJson == item) +
                                            "|" + l.items[1].rawJson;
                                   }),
       "push_back|(T)|void|2|void|Appends.|1|1|pb|push_back|2|2:1-2:5|push_back;x|||-1|||0||||-1|" + kNoRange +
           "||1|{\"label\":\"x\"}"},
      {"completion item text not kept",
       ReadAs<LSP::CompletionList>(R"({"items":[{"label":"x","data":1}]})",
                                   [](const LSP::CompletionList& l) { return "[" + l.items.at(0).rawJson + "]"; },
                                   WithoutItemJson()),
       "[]"},
      {"locations null", ReadAs<LSP::LocationsList>("null", Locations), "0|"},
      {"location single", ReadAs<LSP::LocationsList>(R"({"uri":"file:///a.c","range":)" + kRange + "}", Locations),
       "1|file:///a.c|2:1-2:5"},
      {"locations array", ReadAs<LSP::LocationsList>(R"([{"uri":"file:///a.c"},{"uri":"file:///b.c"}])", Locations),
       "2|file:///a.c|" + kNoRange + ";file:///b.c|" + kNoRange},
      {"hover text", ReadAs<LSP::Hover>(R"({"contents":"int x"})", Hovered), "|int x||" + kNoRange},
      {"hover marked strings",
       ReadAs<LSP::Hover>(R"({"contents":["first",{"language":"c","value":"int x"},"second"]})", Hovered),
       "|first|c:int x|" + kNoRange},
      {"signature help",
       ReadAs<LSP::SignatureHelp>(
           R"j({"signatures":[{"label":"f(int a)","documentation":"Does f.","parameters":[{"label":"int a"}]}]})j",
           Signatures),
       "-1|-1|f(int a)|Does f.|int a"},
      {"signature parameter labelled by offsets",
       ReadAs<LSP::SignatureHelp>(R"j({"signatures":[{"label":"f(int a)","parameters":[{"label":[2,7]}]}]})j",
                                  Signatures),
       "threw: Error:Error:Expecting a 'string' JSON object but found 'array ' JSON object.\n\n"
       "Expecting a array JSON object but found 4 JSON object.\n\n"
       "Expecting a array JSON object but found 4 JSON object."},
      // Hierarchical symbols take the requested document and their own range.
      {"document symbols",
       ReadAs<LSP::SymbolInformationList>(
           symbols, [](const LSP::SymbolInformationList& l) { return Symbols(l.items); },
           LSP::SymbolInformationList("file:///style.css")),
       "body|5|file:///style.css|2:1-2:5{color|7|file:///style.css|3:2-3:9};flat|12|file:///other.css|2:1-2:5"},
      {"workspace symbol without location",
       ReadAs<LSP::SymbolInformationList>(R"([{"name":"x","kind":13}])",
                                          [](const LSP::SymbolInformationList& l) { return Symbols(l.items); }),
       "x|13||" + kNoRange},
      {"symbols not an array",
       ReadAs<LSP::SymbolInformationList>("{}", [](const LSP::SymbolInformationList&) { return ""; }), kNotAnArray},
      {"formatting edits",
       ReadAs<LSP::DocumentFormattingList>("[{\"range\":" + kRange + R"(,"newText":"  "}])",
                                           [](const LSP::DocumentFormattingList& l) { return Edits(l.items); }),
       "2:1-2:5|  "},
      {"formatting edit text not a string",
       ReadAs<LSP::DocumentFormattingList>(R"([{"range":{},"newText":1}])",
                                           [](const LSP::DocumentFormattingList&) { return ""; }),
       "threw: Error:Expecting a 'string' JSON object but found 'number' JSON object.\n\n"
       "Expecting a array JSON object but found 4 JSON object."},
      // Code actions mix with bare commands in one list.
      {"code actions", ReadAs<LSP::CodeActionList>(actions, Actions),
       "Run||0|1|Run|run|[1,{\"a\":null}]||;Fix|quickfix|1|1|Then|after||E1|file:///a.c|3|2:1-2:5|x;Bare||0|0|||||"},
      {"code actions not an array", ReadAs<LSP::CodeActionList>("{}", Actions), kNotAnArray},
      // Parents are read innermost first.
      {"selection ranges",
       ReadAs<LSP::SelectionRangeList>(
           R"([{"range":{"start":{"line":5,"character":2},"end":{"line":5,"character":4}},"parent":{"range":)"
           R"({"start":{"line":5,"character":0},"end":{"line":6,"character":0}},"parent":{"range":)"
           R"({"start":{"line":0,"character":0},"end":{"line":9,"character":0}}}}},{"range":{}}])",
           Selections),
       "5:2-5:4|5:0-6:0,0:0-9:0;" + kNoRange + "|"},
      // A label is text or its parts joined.
      {"inlay hints", ReadAs<LSP::InlayHintList>(hints, Hints),
       "value:||2|0|1||;: Rectangle|: @,Rectangle@file:///s.h|-1|0|0|type|4:1-4:1|: Rectangle"},
      {"prepare rename: range and placeholder",
       ReadAs<LSP::PrepareRenameResult>(
           R"({"range":{"start":{"line":2,"character":3},"end":{"line":2,"character":5}},"placeholder":"x"})",
           Renaming),
       "1|2:3-2:5|x"},
      {"prepare rename: default", ReadAs<LSP::PrepareRenameResult>(R"({"defaultBehavior":true})", Renaming),
       "1|" + kNoRange + "|"},
      {"prepare rename: no default", ReadAs<LSP::PrepareRenameResult>(R"({"defaultBehavior":false})", Renaming),
       "0|" + kNoRange + "|"},
      {"prepare rename: null", ReadAs<LSP::PrepareRenameResult>("null", Renaming), "0|" + kNoRange + "|"},
  });
}

TEST(FeatureResults, NestingIsReadToAThousandLevelsAndNoDeeper) {
  for (int depth : {1000, 1001, 300000}) {
    std::string tree;
    for (int level = 0; level < depth; ++level) tree += R"({"name":"s","kind":5,"children":[)";
    for (int level = 0; level < depth; ++level) tree += "]}";
    LSP::SymbolInformationList nested("file:///deep.css");
    std::string thrown = ThrownText([&] { vexil_test::ReadResult("[" + tree + "]", nested); });
    EXPECT_EQ(thrown.find("Failed to read JSON object: nested deeper than 1000 levels") != std::string::npos,
              depth > 1000)
        << "symbols " << depth << ": " << thrown;
  }
  // Each parent wraps the range before it; the last wrapped is the innermost.
  for (const int depth : {1000, 1001}) {
    std::string json = R"({"range":)" + kRange + "}";
    for (int k = 0; k < depth; ++k) json = R"({"range":)" + kRange + R"(,"parent":)" + json + "}";
    LSP::SelectionRangeList deep;
    const std::string thrown = ThrownText([&] { vexil_test::ReadResult("[" + json + "]", deep); });
    if (depth == 1000) EXPECT_EQ(deep.items.at(0).parents.size(), 1000u) << thrown;
    else EXPECT_THAT(thrown, testing::HasSubstr("parent\nFailed to read JSON object: nested deeper than 1000 levels"));
  }
}

// A completion reply is read from the parser's events when it has the shape servers send;
// each row says whether that read takes the text, and a taken one must hold what the
// document read holds, a declined one must leave the list as it was.
TEST(FeatureResults, CompletionRepliesReadFromEventsAsTheDocumentReadsThem) {
  const std::string item = R"j({"label":"push_back","labelDetails":{"detail":"(T)","description":"void"},"kind":2,)j"
                           R"("detail":"void","documentation":{"kind":"markdown","value":"A\u00e9\n"},)"
                           R"("deprecated":true,"sortText":"1","filterText":"pb","insertText":"push_back",)"
                           R"("insertTextFormat":2,"score":0.5,"data":{"a":[[{"b":null}]]},"textEdit":{"range":)" +
                           kRange + R"(,"newText":"push_back"}})";
  const auto reply = [](const std::string &result) { return R"({"jsonrpc":"2.0","id":7,"result":)" + result + "}"; };
  const auto items = [&](const std::string &elements) {
    return reply(R"({"isIncomplete":false,"items":[)" + elements + "]}");
  };
  const std::pair<std::string, const char *> rows[] = {
      {items(item + R"(,{"label":"x"},null,{"textEdit":null,"labelDetails":{},"documentation":"d"})"), "taken"},
      {reply("[" + item + "]"), "taken"},
      {reply("null"), "taken"},
      {R"({"id":7,"result":{"items":[]},"jsonrpc":null})", "taken"},
      {items(R"({"label":"x","data":)" + std::string(300000, '[') + std::string(300000, ']') + "}"), "taken"},
      {items(R"({"textEdit":{"range":{"start":{"line":1}}}})"), "taken"},
      {R"({"jsonrpc":"2.0","result":{"items":[]},"id":7})", "declined"},  // the result before the id
      {R"({"jsonrpc":"2.0","id":8,"result":{"items":[]}})", "declined"},
      {R"({"jsonrpc":"2.0","id":"7","result":{"items":[]}})", "declined"},
      {R"({"jsonrpc":"2.0","id":7,"method":"m","result":{"items":[]}})", "declined"},
      {R"({"jsonrpc":"2.0","id":7,"result":{"items":[]},"error":{"code":1}})", "declined"},
      {R"({"jsonrpc":"2.0","id":7,"id":7,"result":{"items":[]}})", "declined"},
      {items(R"({"label":"x","label":"y"})"), "declined"},
      {reply(R"({"items":null})"), "declined"},
      {reply(R"({"items":{}})"), "declined"},
      {reply(R"("text")"), "declined"},
      {items(R"({"kind":2.0})"), "declined"},
      {items(R"({"kind":2147483648})"), "declined"},
      {items(R"({"kind":-2147483648,"insertTextFormat":2147483647})"), "taken"},
      {items(R"({"documentation":["a"]})"), "declined"},
      {items(R"({"textEdit":{"range":{"start":{"line":"1"}}}})"), "declined"},
      {items(R"({"label":3})"), "declined"},
      {items("3"), "declined"},
      {items(item) + " x", "declined"},
      {"2", "declined"},
      {"[]", "declined"},
      {items(item).substr(0, 200), "declined"},
      {"\xEF\xBB\xBF" + items(item), "declined"},
  };
  for (const auto &[text, expected] : rows) EXPECT_EQ(fuzz::ReadBothWays(text, 7), expected) << text.substr(0, 300);
}

TEST(FeatureResults, SemanticTokensDecodeToAbsolutePositionsAndTheLegendsNames) {
  LSP::SemanticTokensLegend legend;
  legend.tokenTypes = {"variable", "function"};
  legend.tokenModifiers = {"declaration", "static"};
  const auto decoded = [&](const LSP::SemanticTokens& tokens) {
    return Fields(tokens.resultId, Items(tokens.Decode(legend), [](const LSP::SemanticToken& t) {
                    return Fields(t.line, t.character, t.length, t.type, t.typeIndex, t.modifierBits,
                                  Items(t.modifiers, [](const std::string& m) { return m; }, ","));
                  }));
  };
  // Same line twice (starts add up), a new line (start from 0), an unknown type and
  // modifier bits beyond the legend (the 32nd included), and an incomplete last group.
  EXPECT_EQ(ReadAs<LSP::SemanticTokens>(R"({"resultId":"7","data":[2,4,3,1,1, 0,6,2,0,2, 3,1,5,9,4294967295, 1,2]})",
                                        decoded),
            "7|2|4|3|function|1|1|declaration;2|10|2|variable|0|2|static;5|1|5||9|4294967295|declaration,static");
  EXPECT_EQ(ReadAs<LSP::SemanticTokens>(R"({"data":[1,-2]})", decoded),
            "threw: Expecting a uint JSON object but found 6 JSON object .");
}

}  // namespace

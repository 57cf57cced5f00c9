// Parsing with readable error texts; typed member access: defaults for missing and null
// members, the exact texts of type mismatches, the JSON library's assertions surfacing as
// AssertException; and compact writing: member order, omitted empty strings, escaping and
// raw values.
#include <gtest/gtest.h>

#include <filesystem>
#include <functional>
#include <stdexcept>
#include <string>

#include "../fuzz/plain_events.h"
#include "../protocol/reply_helpers.h"
#include "json/members.h"
#include "json/rapidjson.h"
#include "vexil/json/json.h"

namespace {

using vexil_test::Fields;

// Parses `json` and keeps the document alive for the views the test takes.
struct Parsed {
  explicit Parsed(const std::string& json) { EXPECT_TRUE(reader.Parse(json)) << reader.Error(); }
  LSP::xObject Root() { return reader.Root(); }
  LSP::xReader reader;
};

template <typename Call>
std::string ErrorText(Call call) {
  try {
    call();
  } catch (const AssertException& e) {
    return std::string("assert: ") + e.what();
  } catch (const std::exception& e) {
    return e.what();
  }
  return "no exception";
}

// The value a look-up returns, as text, or the text of what it throws.
template <typename Call>
std::string Outcome(Call call) {
  std::string value;
  std::string error = ErrorText([&] { value = call(); });
  return error == "no exception" ? value : error;
}

std::string Mismatch(const char* expected, const char* found) {
  return std::string("Expecting a '") + expected + "' JSON object but found '" + found + "' JSON object.";
}

// The text of a model object whose members `write` writes, for writer tests.
std::string Written(const std::function<void(LSP::xWriter&)>& write) {
  struct Members : LSP::JsonObject {
    explicit Members(const std::function<void(LSP::xWriter&)>& write) : write(write) {}
    const char* Name() const override { return "members"; }
    void Read(const LSP::xObject&) override {}
    void Write(LSP::xWriter& writer) override { write(writer); }
    const std::function<void(LSP::xWriter&)>& write;
  } object(write);
  return LSP::ToJsonText(object);
}

}  // namespace

// A byte order mark is skipped byte by byte, and a NUL byte ends the text, with the caret
// still under the error's place in the whole text.
TEST(xReader, ParseErrorsShowTextAndCaretUnderTheOffset) {
  using namespace std::string_literals;
  const std::pair<std::string, std::string> rows[] = {
      {"{\"a\":}", "Invalid value.\n\n\n{\"a\":}\n     ^"},
      {"", "The document is empty.\n\n\n\n^"},
      {"{} {}", "The document root must not be followed by other values.\n\n\n{} {}\n   ^"},
      {"[1,", "Invalid value.\n\n\n[1,\n   ^"},
      {"{\"s\":\"\\x\"}", "Invalid escape character in string.\n\n\n{\"s\":\"\\x\"}\n      ^"},
      {"\xEF\xBB\xBF{\"a\":}", "Invalid value.\n\n\n\xEF\xBB\xBF{\"a\":}\n        ^"},
      {"{\"s\":\"a\0b\"}"s, "Missing a closing quotation mark in string.\n\n\n{\"s\":\"a\0b\"}\n       ^"s},
      {"\xBF\xEF{}"s, "Invalid value.\n\n\n\xBF\xEF{}\n ^"},
  };
  LSP::xReader reader;
  for (const auto& [text, error] : rows) {
    EXPECT_FALSE(reader.Parse(text)) << text;
    EXPECT_EQ(reader.Error(), error) << text;
  }
  EXPECT_TRUE(reader.Parse("\xBB{\"a\":1}\0{}"s));
  EXPECT_EQ(reader.Error(), "");
  EXPECT_EQ(reader.Root().Int("a"), 1);
}

// The plain reader takes what servers write, with RapidJSON's events, and leaves the rest
// to it: every text RapidJSON rejects, numbers it may find too big, lone low surrogates
// (on which its versions differ) and nesting deeper than 32.
TEST(PlainReader, ReportsRapidJsonsEventsOrDeclines) {
  using namespace std::string_literals;
  const std::string deep = std::string(32, '[') + "1" + std::string(32, ']');
  const std::pair<std::string, const char*> rows[] = {
      {R"j({"jsonrpc":"2.0","id":7,"result":{"isIncomplete":false,"items":[{"label":" Área()","kind":2,)j"
       R"("score":0.9368076324462891,"textEdit":{"range":{"start":{"line":12,"character":0}}}}]}})",
       "read"},
      {"[0,-0,7,-7,4294967295,4294967296,-2147483648,-2147483649,1.5,-0.25e-3,2E+10,1e99,123456789012345678]", "read"},
      {R"(["a\"b\\c\/d\b\f\n\r\t", "\u00e9\u20AC\ud83d\ude00", "x\u0000y", ")" "\xff\xfe" R"("])", "read"},
      {" { \"a\" : [ true , false , null ] , \"b\" : { } , \"c\" : [ ] } \r\n\t", "read"},
      {"[1]\0junk"s, "read"},
      {deep, "read"},
      {"[" + deep + "]", "declined"},
      {"[1234567890123456789]", "declined"},
      {"[1e100]", "declined"},
      {R"(["\udc00"])", "declined"},
      {R"(["\ud800x"])", "declined"},
      {R"(["\ud800\u0041"])", "declined"},
      {R"(["\ud800\ue000"])", "declined"},
      {R"(["\u12g4"])", "declined"},
      {R"(["\x"])", "declined"},
      {"[\"a\0b\"]"s, "declined"},
      {"[\"a\tb\"]", "declined"},
      {"[\"a\037b\"]", "declined"},
      {"[\"abc", "declined"},
      {"[1,]", "declined"},
      {R"({"a":1,})", "declined"},
      {R"({"a" 1})", "declined"},
      {"{1:2}", "declined"},
      {"[01]", "declined"},
      {"[1.]", "declined"},
      {"[.5]", "declined"},
      {"[-]", "declined"},
      {"[1e]", "declined"},
      {"[tru]", "declined"},
      {"nul", "declined"},
      {"[1] x", "declined"},
      {R"({"a":1}})", "declined"},
      {"[", "declined"},
      {"", "declined"},
      {"  ", "declined"},
  };
  for (const auto& [text, expected] : rows) EXPECT_EQ(fuzz::PlainAgrees(text), expected) << text;
  // Every reply recorded from clangd and pylsp is in the form it takes.
  for (const auto& file : std::filesystem::recursive_directory_iterator(std::string(VEXIL_TEST_DATA) + "/replies")) {
    if (file.is_regular_file()) EXPECT_EQ(fuzz::PlainAgrees(vexil_test::ReadFile(file.path().string())), "read") << file;
  }
}

// The document's named objects, and a model class read from the document by its name.
TEST(xReader, NamedObjectsOfTheDocument) {
  struct Named : LSP::JsonObject {
    const char* Name() const override { return "X"; }
    void Read(const LSP::xObject& value) override { seen = value.Int("v"); }
    using LSP::JsonObject::Read;
    void Write(LSP::xWriter&) override {}
    int seen = 0;
  } named;
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"position":{"line":3},"X":{"v":9}})"));
  EXPECT_EQ(reader.Object("position").Int("line"), 3);
  EXPECT_EQ(ErrorText([&] { reader.Object("range"); }), "Document does not contain 'range' JSON object.");
  named.Read(reader);
  EXPECT_EQ(named.seen, 9);
  ASSERT_TRUE(reader.Parse(R"({"Y":{}})"));
  EXPECT_EQ(ErrorText([&] { named.Read(reader); }), "Document does not contain 'X' JSON object.");
  ASSERT_TRUE(reader.Parse("[1]"));
  EXPECT_EQ(ErrorText([&] { reader.Object("x"); }).rfind("assert: ", 0), 0u);
}

TEST(xObject, MissingAndNullMembersYieldTheFixedDefaults) {
  for (const char* json : {R"({})", R"({"v":null})", "null"}) {
    Parsed doc(json);
    LSP::xObject o = doc.Root();
    EXPECT_EQ(Fields(o.Int("v"), o.Int64("v"), o.UInt("v"), o.UInt64("v"), o.Double("v"), o.Bool("v"), o.String("v"),
                     o.Integers("v").size(), o.Strings("v").size(), o.Object("v").IsNull(),
                     o.Object("v").Object("w").Int("x")),
              "-1|-1|0|0|0|0||0|0|1|-1")
        << json;
    EXPECT_EQ(o.HasObject("v"), std::string(json) == R"({"v":null})") << json;  // a null member is there
  }
}

// A member of the look-up's type is returned (AsInt also reads a decimal string); one of
// another type names the expected and found types; where the JSON library asserts instead,
// its assertion is an AssertException.
TEST(xObject, TypedLookUpsGiveTheMemberOrNameTheMismatch) {
  Parsed doc(R"({"i":-3,"big":5000000000,"u":7,"d":2.5,"b":true,"s":"t\u00e9xt","v":[1,2,3],"w":["a","b"],)"
             R"("f":1.0,"a":[],"o":{},"neg":-1,"x":false,"mixed":[1,2.5],"ws":["a",1],"arr":[1],)"
             R"("digits":"42abc","letters":"abc","huge":"99999999999","spaced":" -7"})");
  LSP::xObject o = doc.Root();
  // The members, then views of them.
  EXPECT_EQ(
      Fields(o.Int("i"), o.Int64("big"), o.UInt("u"), o.UInt64("big"), o.Double("d"), o.Bool("b"), o.String("s"),
             o.Object("v").IsArray(), o.Object("i").IsInt(), o.Object("s").GetString(), o.Object("i").GetString()),
      "-3|5000000000|7|5000000000|2.5|1|t\xc3\xa9xt|1|1|t\xc3\xa9xt|");
  EXPECT_EQ(o.Integers("v"), (std::vector<int>{1, 2, 3}));
  EXPECT_EQ(o.Strings("w"), (std::vector<std::string>{"a", "b"}));
  // AsInt takes a number, or a string that starts with a decimal number.
  EXPECT_EQ(Fields(o.Object("i").AsInt(), o.Object("digits").AsInt(), o.Object("spaced").AsInt(),
                   o.Object("b").AsInt(7), o.Object("missing").AsInt(7), o.Object("digits").AsInt(7)),
            "-3|42|-7|7|7|42");
  EXPECT_THROW(o.Object("letters").AsInt(7), std::invalid_argument);

  EXPECT_EQ(ErrorText([&] { o.Int("s"); }), Mismatch("int", "string"));
  EXPECT_EQ(ErrorText([&] { o.Int("f"); }), Mismatch("int", "number"));
  EXPECT_EQ(ErrorText([&] { o.Int("big"); }), Mismatch("int", "number"));
  EXPECT_EQ(ErrorText([&] { o.Int64("b"); }), Mismatch("int64", "true"));
  EXPECT_EQ(ErrorText([&] { o.UInt("neg"); }), Mismatch("uint", "number"));
  EXPECT_EQ(ErrorText([&] { o.UInt64("o"); }), Mismatch("uint64", "object"));
  EXPECT_EQ(ErrorText([&] { o.Double("i"); }), Mismatch("double", "number"));
  EXPECT_EQ(ErrorText([&] { o.String("a"); }), Mismatch("string", "array "));
  EXPECT_EQ(ErrorText([&] { o.String("x"); }), Mismatch("string", "false"));
  EXPECT_EQ(ErrorText([&] { o.Integers("o"); }), Mismatch("array", "object"));
  EXPECT_EQ(ErrorText([&] { o.Strings("s"); }), Mismatch("array", "string"));
  EXPECT_EQ(ErrorText([&] { o.Bool("i"); }), "i\nFailed to read JSON bool: " + Mismatch("bool", "number"));
  EXPECT_EQ(ErrorText([&] { o.Object("letters").AsInt(); }), "invalid stoi argument");
  EXPECT_EQ(ErrorText([&] { o.Object("huge").AsInt(); }), "stoi argument out of range");
  EXPECT_EQ(ErrorText([&] { o.Object("b").AsInt(); }), Mismatch("int", "true"));
  EXPECT_EQ(ErrorText([&] { o.Object("d").AsInt(); }), Mismatch("int", "number"));

  EXPECT_EQ(ErrorText([&] { o.Integers("mixed"); }), "assert: data_.f.flags & kIntFlag");
  EXPECT_EQ(ErrorText([&] { o.Strings("ws"); }), "assert: IsString()");
  LSP::xObject array = o.Object("arr");
  EXPECT_EQ(ErrorText([&] { array.Int("x"); }), "assert: IsObject()");
  EXPECT_EQ(ErrorText([&] { array.Bool("x"); }), "x\nFailed to read JSON bool: IsObject()");
  EXPECT_EQ(ErrorText([&] { array.Object("x"); }), "x\nFailed to read JSON object: IsObject()");
  EXPECT_EQ(ErrorText([&] { o.String(nullptr); }), "assert: str != 0");
  EXPECT_EQ(ErrorText([&] { o.HasObject(nullptr); }), "assert: str != 0");
}

// The one-pass look-ups stand in for xObject's own: the same value, default or error text
// for duplicates (the first wins, even when null), names of equal length that differ in
// one byte, names not listed, and values that are not objects.
TEST(Members, LookUpsGiveWhatxObjectGives) {
  static const LSP::MemberNames names{"a", "label", "sortText", "labelDetails", "insertTextFormat!"};
  for (const char* json :
       {R"({"a":1,"a":"x","label":null,"label":"l","sortText":2})", R"({"a":null,"a":3,"labelDetails":{}})",
        R"({"lobel":"x","sortTaxt":"y","labelDetaiLs":true,"insertTextFormat?":1,"insertTextFormat!":"z"})",
        R"({"c":true,"labelDetails":false})", "null", "[1]", "5"}) {
    Parsed doc(json);
    LSP::xObject o = doc.Root();
    const LSP::Members m(o, names);
    for (const char* name : {"a", "label", "sortText", "labelDetails", "insertTextFormat!", "c", "lobel",
                             static_cast<const char*>(nullptr)}) {
      auto same = [&](auto look) {
        EXPECT_EQ(Outcome([&] { return look(m); }), Outcome([&] { return look(o); }))
            << json << " " << (name ? name : "(null)");
      };
      same([&](const auto& v) { return std::to_string(v.Int(name)); });
      same([&](const auto& v) { return v.String(name); });
      same([&](const auto& v) { return std::to_string(v.Bool(name)); });
      same([&](const auto& v) { return std::to_string(v.HasObject(name)); });
      same([&](const auto& v) { return std::to_string(static_cast<int>(v.Object(name).Value().GetType())); });
    }
  }
}

TEST(xWriter, MembersInCallOrderWithEmptyStringsLeftOut) {
  EXPECT_EQ(Written([](LSP::xWriter& w) {
              w.String("empty", "");
              w.Int("z", -1);
              w.UInt("a", 4000000000u);
              w.Bool("t", true);
              w.Int64("big", -5000000000LL);
              w.UInt64("ubig", 18446744073709551615ULL);
              w.Null("n");
              w.Integers("none", {});
              w.Integers("ints", {1, 2});
              w.Strings("strs", {"x", ""});
              w.RequiredString("text", "");
            }),
            R"({"z":-1,"a":4000000000,"t":true,"big":-5000000000,"ubig":18446744073709551615,"n":null,)"
            R"("none":[],"ints":[1,2],"strs":["x",""],"text":""})");
  EXPECT_EQ(Written([](LSP::xWriter& w) { w.String("only", ""); }), "{}");
}

TEST(xWriter, EscapesControlCharactersAndKeepsUtf8Bytes) {
  std::string text = "tab\there \"quoted\" back\\slash\nline\x01\x1f caf\xc3\xa9 \xe2\x82\xac";
  std::string json = Written([&](LSP::xWriter& w) { w.String("s", text); });
  EXPECT_EQ(json, "{\"s\":\"tab\\there \\\"quoted\\\" back\\\\slash\\nline\\u0001\\u001F caf\xc3\xa9 \xe2\x82\xac\"}");
  EXPECT_EQ(Parsed(json).Root().String("s"), text);
  std::string withNul("a\0b", 3);
  EXPECT_EQ(Written([&](LSP::xWriter& w) { w.String("s", withNul); }), "{\"s\":\"a\\u0000b\"}");
}

TEST(xWriter, RawValuesAreCopiedVerbatim) {
  Parsed options(R"({"opts":{"b":[1,"two",null],"a":{"x":1.5}}})");
  const LSP::JsonValue& value = options.Root().Object("opts").Value();
  EXPECT_EQ(Written([&](LSP::xWriter& w) {
              w.Raw("initializationOptions", value);
              w.StartArray("raw");
              w.RawValue("{\"pre\":true}", LSP::JsonType::Object);
              w.EndArray();
            }),
            R"({"initializationOptions":{"b":[1,"two",null],"a":{"x":1.5}},"raw":[{"pre":true}]})");
}

TEST(xWriter, MisuseRaisesAssertException) {
  EXPECT_EQ(ErrorText([] { Written([](LSP::xWriter& w) { w.RawValue("1", LSP::JsonType::Number); }); }).rfind("assert: ", 0), 0u);
  EXPECT_EQ(ErrorText([] { Written([](LSP::xWriter& w) { w.EndArray(); }); }).rfind("assert: ", 0), 0u);
  EXPECT_EQ(ErrorText([] { Written([](LSP::xWriter& w) { w.Int(nullptr, 1); }); }), "assert: str != 0");
}

// Parsing with readable error texts, and compact writing: member order, omitted empty
// strings, escaping, raw values, and misuse reported as AssertException.
#include <gtest/gtest.h>

#include <string>

#include "json/rapidjson.h"
#include "vexil/json/json.h"

namespace {

// A model object whose members are written by a callback, for writer tests.
template <typename WriteMembers>
class Members : public LSP::JsonObject {
 public:
  explicit Members(WriteMembers write) : write_(write) {}
  const char* Name() const override { return "members"; }
  void Read(const LSP::xObject&) override {}
  void Write(LSP::xWriter& writer) override { write_(writer); }

 private:
  WriteMembers write_;
};

template <typename WriteMembers>
std::string Written(WriteMembers write) {
  Members<WriteMembers> object(write);
  return LSP::ToJsonText(object);
}

}  // namespace

TEST(xReader, ParseErrorsShowTextAndCaretUnderTheOffset) {
  LSP::xReader reader;
  EXPECT_FALSE(reader.Parse("{\"a\":}"));
  EXPECT_EQ(reader.Error(), "Invalid value.\n\n\n{\"a\":}\n     ^");
  EXPECT_FALSE(reader.Parse(""));
  EXPECT_EQ(reader.Error(), "The document is empty.\n\n\n\n^");
  EXPECT_FALSE(reader.Parse("{} {}"));
  EXPECT_EQ(reader.Error(), "The document root must not be followed by other values.\n\n\n{} {}\n   ^");
  EXPECT_FALSE(reader.Parse("[1,"));
  EXPECT_EQ(reader.Error().substr(0, 15), "Invalid value.\n");
  EXPECT_FALSE(reader.Parse("{\"s\":\"\\x\"}"));
  EXPECT_EQ(reader.Error(), "Invalid escape character in string.\n\n\n{\"s\":\"\\x\"}\n      ^");
  EXPECT_TRUE(reader.Parse("{\"a\":1}"));
  EXPECT_EQ(reader.Error(), "");
  EXPECT_EQ(reader.Root().Int("a"), 1);
}

TEST(xReader, NamedObjectsOfTheDocument) {
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"position":{"line":3}})"));
  EXPECT_EQ(reader.Object("position").Int("line"), 3);
  try {
    reader.Object("range");
    FAIL() << "no exception";
  } catch (const AssertException&) {
    FAIL() << "wrong exception type";
  } catch (const std::exception& e) {
    EXPECT_STREQ(e.what(), "Document does not contain 'range' JSON object.");
  }
  ASSERT_TRUE(reader.Parse("[1]"));
  EXPECT_THROW(reader.Object("x"), AssertException);
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
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(json));
  EXPECT_EQ(reader.Root().String("s"), text);
  std::string withNul("a\0b", 3);
  EXPECT_EQ(Written([&](LSP::xWriter& w) { w.String("s", withNul); }), "{\"s\":\"a\\u0000b\"}");
}

TEST(xWriter, RawValuesAreCopiedVerbatim) {
  LSP::xReader options;
  ASSERT_TRUE(options.Parse(R"({"opts":{"b":[1,"two",null],"a":{"x":1.5}}})"));
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
  EXPECT_THROW(Written([](LSP::xWriter& w) { w.RawValue("1", LSP::JsonType::Number); }), AssertException);
  EXPECT_THROW(Written([](LSP::xWriter& w) { w.EndArray(); }), AssertException);
  try {
    Written([](LSP::xWriter& w) { w.Int(nullptr, 1); });
    FAIL() << "no exception";
  } catch (const AssertException& e) {
    EXPECT_STREQ(e.what(), "str != 0");
  }
}

TEST(JsonObject, ReadFromDocumentNeedsItsNamedMember) {
  struct Named : LSP::JsonObject {
    const char* Name() const override { return "X"; }
    void Read(const LSP::xObject& value) override { seen = value.Int("v"); }
    using LSP::JsonObject::Read;
    void Write(LSP::xWriter&) override {}
    int seen = 0;
  } named;
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"X":{"v":9}})"));
  named.Read(reader);
  EXPECT_EQ(named.seen, 9);
  ASSERT_TRUE(reader.Parse(R"({"Y":{}})"));
  try {
    named.Read(reader);
    FAIL() << "no exception";
  } catch (const std::exception& e) {
    EXPECT_STREQ(e.what(), "Document does not contain 'X' JSON object.");
  }
}

// The initialize request as servers receive it: the host's options embedded as JSON, and the
// member order of sparse records. The whole body, against a text derived by hand, is the
// connection test's: the request a started connection sends.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "vexil/protocol/initialize.h"

namespace {

std::string OptionsWritten(const std::string& text) {
  LSP::InitializeParams params(1, "", LSP::TraceLevel::Off, LSP::InitializationOptions(text));
  std::string json = LSP::ToJsonText(params);
  const std::string head = R"({"processId":1,)";
  const std::string::size_type end = json.find(R"("capabilities":)");
  return json.substr(head.size(), end - head.size());
}

TEST(InitializeParams, SparseRecordWritesProcessOptionsCapabilitiesTraceInOrder) {
  LSP::InitializeParams params(77, "", LSP::TraceLevel::Verbose, LSP::InitializationOptions(R"({"initializationOptions":7})"));
  const std::string json = LSP::ToJsonText(params);
  EXPECT_THAT(json, testing::StartsWith(R"({"processId":77,"initializationOptions":7,"capabilities":{"workspace":)"));
  EXPECT_THAT(json, testing::EndsWith(R"(}}},"trace":"verbose"})"));
  for (const char* absent : {"rootUri", R"("workspaceFolders":[)", "clientInfo", "rootPath", "locale"})
    EXPECT_THAT(json, testing::Not(testing::HasSubstr(absent)));
  // A level without a protocol name leaves "trace" out.
  LSP::InitializeParams unnamed(1, "", static_cast<LSP::TraceLevel>(9), LSP::InitializationOptions(""));
  EXPECT_THAT(LSP::ToJsonText(unnamed), testing::Not(testing::HasSubstr("trace")));
  // Client info is not part of the request: it is a record of its own.
  LSP::ClientInfo info;
  EXPECT_EQ(LSP::ToJsonText(info), R"({"name":"Tavra IDE - LSP Client","version":"2.9.1"})");
}

TEST(InitializationOptions, OnlyTheWrappedMemberOfValidJsonReachesTheServer) {
  for (const char* ignored : {"", R"({"other":1})", "not json", R"({"initializationOptions":)",
                              R"([{"initializationOptions":1}])", R"("initializationOptions")"})
    EXPECT_EQ(OptionsWritten(ignored), "") << ignored;
  EXPECT_EQ(OptionsWritten(R"({"other":1,"initializationOptions":{"a":[1,"x",null]}})"),
            R"("initializationOptions":{"a":[1,"x",null]},)");
  EXPECT_EQ(OptionsWritten(R"({"initializationOptions":"text"})"), R"("initializationOptions":"text",)");
  EXPECT_EQ(OptionsWritten(R"({"initializationOptions":null})"), R"("initializationOptions":null,)");
  EXPECT_EQ(OptionsWritten(R"( { "initializationOptions" : { "b" : true } } )"), R"("initializationOptions":{"b":true},)");
  // Options are written out recursively: nesting beyond 1,000 levels is dropped.
  for (std::size_t depth : {1000, 1001, 300000}) {
    std::string nested = std::string(depth, '[') + std::string(depth, ']');
    EXPECT_EQ(OptionsWritten(R"({"initializationOptions":)" + nested + "}"),
              depth > 1000 ? "" : R"("initializationOptions":)" + nested + ",")
        << depth;
  }
}

}  // namespace

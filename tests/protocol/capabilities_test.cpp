// The client capability tree: value lists that are left out only when emptied, and opt-in
// additions merged over it in place. The whole default tree is in the initialize request's
// golden text.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/capabilities.h"
#include "vexil/protocol/feature_capabilities.h"

namespace {

TEST(ClientCapabilities, ValueListsAreLeftOutOnlyWhenEmptied) {
  LSP::CompletionItemKindCapabilities kinds;
  kinds.valueSet.clear();
  EXPECT_EQ(LSP::ToJsonText(kinds), "{}");
  // String lists are written even when emptied.
  LSP::HoverClientCapabilities hover;
  hover.contentFormat.clear();
  EXPECT_EQ(LSP::ToJsonText(hover), R"({"dynamicRegistration":false,"contentFormat":[]})");
}

TEST(ClientCapabilities, AdditionsMergeInPlaceAndAppendWhatTheTreeLacks) {
  LSP::FeatureClientCapabilities features;
  const std::string added = LSP::ToJsonText(features);
  // The golden text is also what the recording script announces to real servers.
  EXPECT_EQ(added, vexil_test::ReadDataFile("feature_capabilities.json"));

  LSP::ClientCapabilities capabilities;
  const std::string plain = LSP::ToJsonText(capabilities);
  capabilities.additions = {"not json", "[1]", added, R"({"window":{"workDoneProgress":true}})"};
  const std::string merged = LSP::ToJsonText(capabilities);
  using testing::HasSubstr;
  EXPECT_THAT(merged, testing::StartsWith(R"({"workspace":{"applyEdit":true,"workspaceEdit":{"documentChanges":true,)"
                                          R"("resourceChanges":false},"didChangeConfiguration":)"));
  EXPECT_THAT(merged, HasSubstr(R"("synchronization":{"dynamicRegistration":false,"willSave":true,"willSaveWaitUntil":false,)"));
  EXPECT_THAT(merged, HasSubstr(R"("codeAction":{"dynamicRegistration":false,"codeActionLiteralSupport":{"codeActionKind":)"
                                R"({"valueSet":["","quickfix",)"));
  EXPECT_THAT(merged, HasSubstr(R"("rename":{"dynamicRegistration":false,"prepareSupport":true},"documentLink")"));
  EXPECT_THAT(merged, HasSubstr(R"("diagnostic":{"dynamicRegistration":false},"semanticTokens":{"dynamicRegistration":false,)"
                                R"("requests":{"range":false,"full":true},"tokenTypes":["namespace",)"));
  EXPECT_THAT(merged, testing::EndsWith(R"("multilineTokenSupport":false}},"window":{"workDoneProgress":true}})"));
  capabilities.additions = {"not json"};
  EXPECT_EQ(LSP::ToJsonText(capabilities), plain);
}

}  // namespace

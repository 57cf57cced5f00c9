// The client capability tree: value lists that are left out only when emptied, and opt-in
// additions merged over it. The whole default tree is in the initialize request's golden
// text; how each opt-in's additions merge in place is the connection test's initialize table.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/capabilities.h"
#include "vexil/protocol/feature_capabilities.h"

namespace {

TEST(ClientCapabilities, ValueListsAreLeftOutOnlyWhenEmptiedAndAdditionsNotObjectsIgnored) {
  LSP::CompletionItemKindCapabilities kinds;
  kinds.valueSet.clear();
  LSP::HoverClientCapabilities hover;
  hover.contentFormat.clear();
  LSP::FeatureClientCapabilities features;
  LSP::ClientCapabilities capabilities;
  const std::string plain = LSP::ToJsonText(capabilities);
  capabilities.additions = {"not json", "[1]", R"({"window":{"workDoneProgress":true}})"};
  vexil_test::CheckRows({
      {"number list emptied", LSP::ToJsonText(kinds), "{}"},
      {"string list emptied: still written", LSP::ToJsonText(hover),
       R"({"dynamicRegistration":false,"contentFormat":[]})"},
      // The golden text is also what the recording script announces to real servers.
      {"feature additions", LSP::ToJsonText(features), vexil_test::ReadDataFile("feature_capabilities.json")},
      {"a member the tree lacks is appended", LSP::ToJsonText(capabilities),
       plain.substr(0, plain.size() - 1) + R"(,"window":{"workDoneProgress":true}})"},
  });
}

}  // namespace

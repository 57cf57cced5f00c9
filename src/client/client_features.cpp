// The table of features a host can enable, one row each: a feature may announce client
// capabilities, route server requests to the host, or both.
#include "client/client_features.h"

#include <algorithm>

#include "client/watched_files.h"
#include "vexil/protocol/feature_capabilities.h"

namespace LSP {
namespace {

constexpr char kProgressCreate[] = "window/workDoneProgress/create";
constexpr char kConfiguration[] = "workspace/configuration";
constexpr char kApplyEdit[] = "workspace/applyEdit";

struct Feature {
  const char* name;
  void (*enable)(EnabledFeatures& enabled);
};

const Feature kFeatures[] = {
    // Progress reports ("$/progress") of work the server starts itself, such as indexing.
    {"progress",
     [](EnabledFeatures& enabled) {
       enabled.capabilities.push_back(R"({"window":{"workDoneProgress":true}})");
       enabled.hostRequests.push_back(kProgressCreate);
     }},
    // The host gives the server its settings, section by section.
    {"configuration",
     [](EnabledFeatures& enabled) {
       enabled.capabilities.push_back(R"({"workspace":{"configuration":true}})");
       enabled.hostRequests.push_back(kConfiguration);
     }},
    // The requests IDEs use beyond the classic ones (code action literals, prepared
    // renames, semantic tokens, will-save) and edits the server asks the host to apply.
    {"features",
     [](EnabledFeatures& enabled) {
       FeatureClientCapabilities capabilities;
       enabled.capabilities.push_back(ToJsonText(capabilities));
       enabled.hostRequests.push_back(kApplyEdit);
     }},
    // Files changed on disk in the workspace folders, told to the server as it registers
    // for them (or all of them, when it registers nothing).
    {"watchedFiles",
     [](EnabledFeatures& enabled) {
       enabled.capabilities.push_back(vexil::kWatchedFilesCapabilities);
       enabled.watchedFiles = true;
     }},
    // Columns counted in UTF-8 bytes when the server agrees (ServerCapabilities says which):
    // hosts that keep their texts in UTF-8 then need no conversion.
    {"positionEncoding",
     [](EnabledFeatures& enabled) {
       enabled.capabilities.push_back(R"({"general":{"positionEncodings":["utf-8","utf-16"]}})");
     }},
    // The host answers what the server asks (applyEdit, showMessageRequest...).
    {"messages",
     [](EnabledFeatures& enabled) {
       enabled.hostRequests.insert(enabled.hostRequests.end(), {kProgressCreate, kConfiguration});
       enabled.hostAnswersUnknown = true;
     }},
};

}  // namespace

bool EnableFeature(const std::string& feature, EnabledFeatures& enabled) {
  auto row = std::find_if(std::begin(kFeatures), std::end(kFeatures),
                          [&](const Feature& known) { return feature == known.name; });
  if (row == std::end(kFeatures)) return false;
  if (std::find(enabled.names.begin(), enabled.names.end(), feature) != enabled.names.end()) return true;
  enabled.names.push_back(feature);
  row->enable(enabled);
  return true;
}

}  // namespace LSP

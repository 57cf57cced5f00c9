// The features a host opts in to through Enable: what each adds to the client
// capabilities of the initialize request, and which server requests it hands the host.
#pragma once

#include <string>
#include <vector>

namespace LSP {

struct EnabledFeatures {
  std::vector<std::string> names;  // in the order enabled
  // JSON objects merged over the default capability tree, in order (see
  // ClientCapabilities::additions); none leaves the initialize request as it always was.
  std::vector<std::string> capabilities;
  // Server requests the host's message handler answers instead of the library...
  std::vector<std::string> hostRequests;
  // ...and whether it also answers every request the library has no answer for.
  bool hostAnswersUnknown = false;
  // Whether the connection tells the server about files changed on disk.
  bool watchedFiles = false;
};

// Adds `feature` to `enabled`; false for a name the library does not know. Enabling a
// feature twice changes nothing.
bool EnableFeature(const std::string& feature, EnabledFeatures& enabled);

}  // namespace LSP

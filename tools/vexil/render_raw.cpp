// The answers that come as JSON text: a server's capabilities, one per line with the
// synchronisation spelled out, and the result of a request as the server sent it.
#include <string>
#include <utility>
#include <vector>

#include "render.h"

namespace cli {
namespace {

// The members of `object`, compact JSON as the library writes it, as key and value text.
std::vector<std::pair<std::string, std::string>> Members(const std::string& object) {
  std::vector<std::pair<std::string, std::string>> members;
  int depth = 0;
  bool inString = false;
  std::size_t start = 1;
  for (std::size_t at = 0; at < object.size(); ++at) {
    char c = object[at];
    if (inString) {
      if (c == '\\') ++at;
      else if (c == '"') inString = false;
      continue;
    }
    if (c == '"') inString = true;
    if (c == '{' || c == '[') ++depth;
    if (c == '}' || c == ']') --depth;
    if ((c == ',' && depth == 1) || (c == '}' && depth == 0)) {
      std::string member = object.substr(start, at - start);
      std::size_t colon = member.find("\":");
      if (colon != std::string::npos) members.emplace_back(member.substr(1, colon - 1), member.substr(colon + 2));
      start = at + 1;
    }
  }
  return members;
}

std::string SyncText(const LSP::ServerCapabilities& capabilities) {
  static const char* const kinds[] = {"no changes", "whole text on change", "incremental changes"};
  const LSP::TextDocumentSyncOptions& sync = capabilities.documentSync;
  std::string text = sync.change >= 0 && sync.change <= 2 ? kinds[sync.change] : "changes of kind " + std::to_string(sync.change);
  if (sync.openClose) text += ", open and close";
  if (capabilities.documentSyncSave) text += sync.save.includeText ? ", save with text" : ", save";
  return text;
}

}  // namespace

void PrintCapabilities(std::ostream& out, const Outcome& outcome) {
  std::vector<std::pair<std::string, std::string>> members = Members(outcome.json);
  if (members.empty()) out << "  (none)\n";
  for (const auto& [name, value] : members) {
    if (value == "false" || value == "null") continue;
    out << "  " << name;
    if (name == "textDocumentSync") out << ": " << SyncText(outcome.capabilities);
    else if (value != "true") out << ": " << value;
    out << "\n";
  }
}

void PrintRequestResult(std::ostream& out, const Outcome& outcome) { out << "  " << outcome.json << "\n"; }

}  // namespace cli

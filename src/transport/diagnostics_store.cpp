// Keeping one list per document: each publication or full report replaces the previous
// list, and an empty one removes the document.
#include "transport/diagnostics_store.h"

#include <utility>

namespace vexil {

void DiagnosticsStore::Publish(LSP::PublishDiagnosticsParams& published) {
  Store(published.uri, std::move(published.diagnostics), "");
}

void DiagnosticsStore::Replace(const std::string& uri, const std::vector<LSP::Diagnostic>& items,
                               const std::string& resultId) {
  Store(uri, items, resultId);
}

std::vector<LSP::Diagnostic> DiagnosticsStore::Of(const std::string& uri) const {
  std::lock_guard<std::mutex> lock(mutex_);
  auto found = documents_.find(uri);
  return found == documents_.end() ? std::vector<LSP::Diagnostic>() : found->second.diagnostics;
}

std::string DiagnosticsStore::ResultId(const std::string& uri) const {
  std::lock_guard<std::mutex> lock(mutex_);
  auto found = documents_.find(uri);
  return found == documents_.end() ? "" : found->second.resultId;
}

void DiagnosticsStore::Store(const std::string& uri, std::vector<LSP::Diagnostic> diagnostics,
                             const std::string& resultId) {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    if (diagnostics.empty() && resultId.empty()) {
      documents_.erase(uri);
    } else {
      documents_[uri] = Document{std::move(diagnostics), resultId};
    }
  }
  // Moved only once the list is in place, so a host that sees the new number reads it.
  ++version_;
}

}  // namespace vexil

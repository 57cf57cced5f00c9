// Keeping one list per document: each publication or full report replaces the previous
// list, an empty one removes the document, and past the byte limit the documents least
// recently published are dropped.
#include "transport/diagnostics_store.h"

#include <utility>

namespace vexil {
namespace {

// The list's allocations with its document's key and bookkeeping.
std::size_t Footprint(const std::string& uri, const std::vector<LSP::Diagnostic>& diagnostics,
                      const std::string& resultId) {
  constexpr std::size_t kDocumentOverhead = 128;  // map node, age entry, vector header
  std::size_t bytes = kDocumentOverhead + 2 * uri.capacity() + resultId.capacity() +
                      diagnostics.capacity() * sizeof(LSP::Diagnostic);
  for (const LSP::Diagnostic& diagnostic : diagnostics) {
    bytes += diagnostic.message.capacity() + diagnostic.source.capacity() + diagnostic.codeText.capacity();
  }
  return bytes;
}

}  // namespace

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

std::size_t DiagnosticsStore::Bytes() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return bytes_;
}

void DiagnosticsStore::Store(const std::string& uri, std::vector<LSP::Diagnostic> diagnostics,
                             const std::string& resultId) {
  std::vector<std::string> dropped;
  {
    std::lock_guard<std::mutex> lock(mutex_);
    Forget(uri);
    if (!diagnostics.empty() || !resultId.empty()) {
      std::size_t bytes = Footprint(uri, diagnostics, resultId);
      ages_.push_back(uri);
      documents_[uri] = Document{std::move(diagnostics), resultId, bytes, std::prev(ages_.end())};
      bytes_ += bytes;
    }
    while (bytes_ > byteLimit_ && ages_.size() > 1) {
      dropped.push_back(ages_.front());
      Forget(dropped.back());
    }
  }
  // Moved only once the list is in place, so a host that sees the new number reads it.
  ++version_;
  if (dropped_) {
    for (const std::string& gone : dropped) dropped_(gone);
  }
}

void DiagnosticsStore::Forget(const std::string& uri) {
  auto found = documents_.find(uri);
  if (found == documents_.end()) return;
  bytes_ -= found->second.bytes;
  ages_.erase(found->second.age);
  documents_.erase(found);
}

}  // namespace vexil

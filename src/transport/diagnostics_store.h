// The newest diagnostics of each document of one server, filled on the output reader's
// thread as publications arrive and read on the host's thread; bounded in memory.
#pragma once

#include <atomic>
#include <cstddef>
#include <functional>
#include <list>
#include <map>
#include <mutex>
#include <string>
#include <vector>

#include "vexil/protocol/diagnostics.h"

namespace vexil {

class DiagnosticsStore {
 public:
  // A server that publishes for every file of a big workspace while the host is idle must
  // not grow it without end; beyond this the documents that went longest without a
  // publication give way (the newest list is kept whatever its size).
  static constexpr std::size_t kByteLimit = std::size_t{32} << 20;

  explicit DiagnosticsStore(std::size_t byteLimit = kByteLimit) : byteLimit_(byteLimit) {}

  // Called with the URI of each dropped document, outside the store's lock. Set before
  // anything is stored.
  void OnDrop(std::function<void(const std::string& uri)> dropped) { dropped_ = std::move(dropped); }
  // Replaces the document's list with the published one.
  void Publish(LSP::PublishDiagnosticsParams& published);
  // Replaces the document's list with a pulled report's items and remembers its id.
  void Replace(const std::string& uri, const std::vector<LSP::Diagnostic>& items, const std::string& resultId);
  std::vector<LSP::Diagnostic> Of(const std::string& uri) const;
  // The id of the pulled report the document's list came from; "" after a publication.
  std::string ResultId(const std::string& uri) const;
  // Moves on with every publication or pulled report, so a host polls one number.
  int Version() const { return static_cast<int>(version_.load()); }
  // What the stored lists take, as counted against the limit.
  std::size_t Bytes() const;

 private:
  struct Document {
    std::vector<LSP::Diagnostic> diagnostics;
    std::string resultId;
    std::size_t bytes = 0;
    std::list<std::string>::iterator age;  // its place among the publications
  };

  void Store(const std::string& uri, std::vector<LSP::Diagnostic> diagnostics, const std::string& resultId);
  // Under the lock: forgets `uri`, if stored.
  void Forget(const std::string& uri);

  const std::size_t byteLimit_;
  std::function<void(const std::string& uri)> dropped_;
  mutable std::mutex mutex_;
  // Only documents with diagnostics or a report id: a cleared document takes no room.
  std::map<std::string, Document> documents_;
  std::list<std::string> ages_;  // stored URIs, the longest unpublished first
  std::size_t bytes_ = 0;
  // Unsigned, so a long-lived connection that passes the largest int wraps instead of
  // overflowing; hosts compare for inequality only.
  std::atomic<unsigned> version_{0};
};

}  // namespace vexil

// The newest diagnostics of each document of one server, filled on the output reader's
// thread as publications arrive and read on the host's thread.
#pragma once

#include <atomic>
#include <map>
#include <mutex>
#include <string>
#include <vector>

#include "vexil/protocol/diagnostics.h"

namespace vexil {

class DiagnosticsStore {
 public:
  // Replaces the document's list with the published one.
  void Publish(LSP::PublishDiagnosticsParams& published);
  // Replaces the document's list with a pulled report's items and remembers its id.
  void Replace(const std::string& uri, const std::vector<LSP::Diagnostic>& items, const std::string& resultId);
  std::vector<LSP::Diagnostic> Of(const std::string& uri) const;
  // The id of the pulled report the document's list came from; "" after a publication.
  std::string ResultId(const std::string& uri) const;
  // Moves on with every publication or pulled report, so a host polls one number.
  int Version() const { return static_cast<int>(version_.load()); }

 private:
  struct Document {
    std::vector<LSP::Diagnostic> diagnostics;
    std::string resultId;
  };

  void Store(const std::string& uri, std::vector<LSP::Diagnostic> diagnostics, const std::string& resultId);

  mutable std::mutex mutex_;
  // Only documents with diagnostics or a report id: a cleared document takes no room.
  std::map<std::string, Document> documents_;
  // Unsigned, so a long-lived connection that passes the largest int wraps instead of
  // overflowing; hosts compare for inequality only.
  std::atomic<unsigned> version_{0};
};

}  // namespace vexil

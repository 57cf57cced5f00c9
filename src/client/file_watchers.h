// The file watchers a language server registers through "client/registerCapability" for
// "workspace/didChangeWatchedFiles", and which changes on disk they ask to hear of.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "client/glob_pattern.h"

namespace vexil {

// The protocol's FileChangeType.
enum FileChangeType : int { kFileCreated = 1, kFileChanged = 2, kFileDeleted = 3 };

// Not thread-safe: its owner serialises the calls.
class FileWatcherRegistry {
 public:
  // Takes the params of "client/registerCapability" and keeps the registrations of
  // "workspace/didChangeWatchedFiles"; those of other methods are not this registry's. A
  // registration replaces an earlier one with its id; a watcher it cannot read is skipped.
  // False, with the reason in `error` and nothing kept, for params that are not an object
  // with a "registrations" array.
  bool Register(const std::string& params, std::string& error);
  // Takes the params of "client/unregisterCapability" and drops the registrations named in
  // "unregisterations" (the protocol's spelling; "unregistrations" is read too).
  bool Unregister(const std::string& params, std::string& error);
  // Whether a change of `type` at `path` (absolute) is for the server. `folder` is the
  // workspace folder it was seen in. Until the server registers a watcher every change is;
  // from then on only those that a watcher matches, with its kind, even once all are gone.
  bool Wants(const std::string& path, const std::string& folder, FileChangeType type) const;

 private:
  struct Watcher {
    GlobPattern pattern;
    // '/'-separated; for a relative pattern, the directory it is relative to.
    std::string base;
    bool relative;
    unsigned kind;  // WatchKind bits: 1 create, 2 change, 4 delete
  };

  std::map<std::string, std::vector<Watcher>> registrations_;  // by registration id
  bool registered_ = false;
};

}  // namespace vexil

// Which project watches cover which inotify descriptors, and how the raw events of one
// read become one batch per project watch. Linux only; the caller holds the monitor's lock.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <unordered_map>
#include <vector>

#include "watch/change_monitor.h"

namespace vexil {

// What one read of the inotify descriptor amounts to.
struct ReadOutcome {
  std::map<std::int64_t, ChangeBatch> batches;
  // Watches whose root was deleted or moved away; the tree has already forgotten them.
  std::vector<std::int64_t> rootsGone;
  // The kernel dropped events: every watch may have missed some.
  bool overflow = false;
};

class InotifyTree {
 public:
  struct Event;  // one raw inotify event, parsed

  InotifyTree(int inotifyFd, const MonitorHandlers& handlers);
  InotifyTree(const InotifyTree&) = delete;
  InotifyTree& operator=(const InotifyTree&) = delete;

  // Watches `root` and every directory below it for watch `id`. Returns 0, or the errno of
  // the root's own watch (subdirectories that cannot be watched are reported instead).
  int AddRoot(const std::string& root, std::int64_t id);
  // Forgets watch `id` and drops the descriptors no other watch needs.
  void Remove(std::int64_t id);
  // Turns the events of one read into batches, following created and moved directories.
  ReadOutcome Translate(const char* buffer, std::size_t length);

 private:
  // Prefix of a directory relative to each root that covers it: "" for the root, "a/b/" below.
  using Owners = std::map<std::int64_t, std::string>;
  struct Project {
    std::string root;
    std::map<std::string, int> descriptors;  // by prefix, so a subtree is one key range
  };

  void Created(const Event& event, const Owners& owners, ReadOutcome& outcome);
  void Removed(const Event& event, const Owners& owners, ReadOutcome& outcome);
  void MovedFrom(const Event& event, const Event* partner, const Owners& owners,
                 ReadOutcome& outcome);
  void MovedTo(const Event& event, const Event* partner, const Owners& owners,
               ReadOutcome& outcome);
  void SelfChanged(const Event& event, const Owners& owners, ReadOutcome& outcome);

  // Watches `path` and its subdirectories for `owners`; with an outcome, every entry found
  // is reported as added, since it may have appeared before the watch existed.
  void AddSubtree(const std::string& path, const Owners& owners, ReadOutcome* outcome);
  void Scan(const std::string& path, const Owners& owners, ReadOutcome* outcome);
  void Adopt(int descriptor, const Owners& owners);
  void Disown(int descriptor, std::int64_t id);
  void DetachSubtree(std::int64_t id, const std::string& prefix);
  void MoveSubtree(std::int64_t id, const std::string& from, const std::string& to);
  void RootGone(std::int64_t id, ReadOutcome& outcome);
  // The prefix under which watch `id` sees directory `descriptor`; null when it does not.
  const std::string* PrefixIn(int descriptor, std::int64_t id) const;
  // The path of the directory that the first of `below` names.
  std::string EntryPath(const Owners& below) const;

  int fd_;
  const MonitorHandlers& handlers_;
  std::unordered_map<int, Owners> owners_;  // by inotify descriptor
  std::map<std::int64_t, Project> projects_;
};

}  // namespace vexil
